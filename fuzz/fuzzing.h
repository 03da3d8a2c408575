// What the fuzzers share: how an input is read, and how one of them says that something is wrong.
#pragma once

#include <reference/icu_reference.h>

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <iostream>
#include <string>
#include <string_view>
#include <unistd.h>
#include <vector>

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size);

namespace kvt::fuzz {

/// Reads decisions from the front of an input; what is left is the text.
class Input {
public:
    Input(const std::uint8_t* data, std::size_t size) : rest_(reinterpret_cast<const char*>(data), size) {}

    /// 0 when the input has ended.
    unsigned byte() {
        if (rest_.empty()) {
            return 0;
        }
        const auto value = static_cast<unsigned char>(rest_.front());
        rest_.remove_prefix(1);
        return value;
    }
    std::string_view rest() const { return rest_; }

    /// One of a table.
    template <typename T, std::size_t N>
    const T& pick(const T (&table)[N]) {
        return table[byte() % N];
    }

    template <typename T>
    const T& pick(const std::vector<T>& table) {
        return table[byte() % table.size()];
    }

private:
    std::string_view rest_;
};

/// Stops the fuzzer, with what was seen and what should have been; `what` is made into a text only then. It goes to
/// clog, since a fuzzer may listen to what others write to cerr.
template <typename Actual, typename Expected, typename... What>
void requireEqual(const Actual& actual, const Expected& expected, const What&... what) {
    if (!(actual == expected)) {
        (std::clog << ... << what) << "\nis:       " << actual << "\nexpected: " << expected << std::endl;
        std::abort();
    }
}

/// Bytes that are shown in hexadecimal.
struct Hex {
    std::string_view bytes;

    friend std::ostream& operator<<(std::ostream& stream, const Hex& hex) {
        return stream << kvt::test::hex(hex.bytes, 400);
    }
};

template <typename... What>
void require(bool condition, const What&... what) {
    if (!condition) {
        (std::clog << ... << what) << std::endl;
        std::abort();
    }
}

/// Has temporary files lie in memory from now on, where the system can; a folder that was chosen stays.
inline bool keepFilesInMemory() {
    return ::access("/dev/shm", W_OK | X_OK) == 0 && ::setenv("TMPDIR", "/dev/shm", 0) == 0;
}

/// One converter of each kind that ICU has, by canonical names. The order is part of the corpus: add at the end.
inline constexpr const char* encodings[] = {
    "UTF-8",
    "UTF-16LE",
    "UTF-16BE",
    "UTF-32LE",
    "UTF-32BE",
    "US-ASCII",
    "ISO-8859-1",
    "windows-1252",
    "KOI8-R",
    "Shift_JIS",
    "EUC-JP",
    "GB18030",
    "Big5",
    "ISO-2022-JP",
    "UTF-7",
    "CESU-8",
    "SCSU",
    "BOCU-1",
    "HZ-GB-2312",
    "IBM037",
    "ibm-930_P120-1999",
    "ibm-16684_P110-2003",
    "IMAP-mailbox-name",
    "ISO-2022-CN",
};

/// By canonical names those above, then all others that ICU lists; fewer than a byte can tell apart, of the releases of
/// ICU so far.
inline const std::vector<std::string>& allEncodings() {
    static const std::vector<std::string> all = [] {
        std::vector<std::string> names(std::begin(encodings), std::end(encodings));
        for (const std::string& listed : kvt::test::availableConverters()) {
            const std::string name = kvt::test::canonicalName(listed);
            // A name that opens another converter than the one it is the name of is only a spelling.
            const bool isOwn = kvt::test::canonicalName(name) == name;
            if (isOwn && std::find(names.begin(), names.end(), name) == names.end()) {
                names.push_back(name);
            }
        }
        return names;
    }();
    return all;
}

} // namespace kvt::fuzz
