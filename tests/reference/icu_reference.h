// The expected result of a conversion, computed slowly: ICU's own functions, new converters for each call, one
// buffer for everything, callbacks that only take notes. It shares no code with the library; the tests compare.
#pragma once

#include <cstdint>
#include <ostream>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::test {

/// How a conversion ended, as a host sees it.
struct Outcome {
    std::string bytes;                   ///< what stands in the output
    unsigned long number = 0;            ///< message number, 0 when nothing was lost
    std::vector<std::string> parameters; ///< of the message
    std::vector<std::pair<std::string, std::string>> pairs;

    friend bool operator==(const Outcome&, const Outcome&) = default;
};
std::ostream& operator<<(std::ostream& stream, const Outcome& outcome);

/// The names that ICU lists, in its order.
std::vector<std::string> availableConverters();

/// The name under which the library knows what ICU calls `name`; empty when ICU cannot open it.
std::string canonicalName(const std::string& name);

/// What ICU makes of the bytes.
struct Raw {
    std::string bytes;
    int badInput = 0;         ///< ICU's code of the last bad input
    int notRepresentable = 0; ///< ICU's code of the first character that was lost
    int calls = 0;            ///< calls of the two callbacks, whatever became of them
    int status = 0;           ///< ICU's code at the end, 0 when it did not give up
};
/// How much room ICU has at a time; 0 for more than the text can need.
struct Buffers {
    std::size_t pivotUnits = 0;
    std::size_t outputBytes = 0;
};
/// Both names are canonical ones.
Raw convertWithIcu(const std::string& from, const std::string& to, std::string_view bytes,
                   Buffers buffers = {});

/// What is lost of a text on its way, by callbacks that see each loss. The two kinds are apart, since ICU converts a
/// text in two steps.
struct Losses {
    std::string bytes;                 ///< the text with its substitutions
    std::vector<std::string> badInput; ///< the bytes of each place that is not text
    std::vector<char32_t> characters;  ///< that the target lacks, substitutions for bad input not among them
};
Losses lossesOfIcu(const std::string& from, const std::string& to, std::string_view bytes);

/// What ICUTranscoder has to do.
Outcome expectedTranscode(const std::string& from, const std::string& to, std::string_view bytes);

/// What the assignment of a UString<30> to a UString<30> has to do, for encodings of text.
Outcome expectedAssign(const std::string& from, const std::string& to, std::string_view bytes);

/// Bytes as "\xE9", the rest as it is; for parameters.
std::string escaped(std::string_view bytes);
/// All bytes as two digits, at most `limit` of them; for messages of tests.
std::string hex(std::string_view bytes, std::size_t limit = 64);

/// Text that the converter can hold, as UTF-16: `count` characters drawn from its own set, and the same for all
/// calls with one `seed`. ASCII has a good share.
std::u16string ownText(const std::string& name, std::size_t count, std::uint64_t seed);
/// The same as bytes of the encoding.
std::string encodeWithIcu(const std::string& name, std::u16string_view text);

} // namespace kvt::test
