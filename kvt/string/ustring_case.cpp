// Case mapping. ICU maps UTF-8 and UTF-16 directly, ASCII is mapped here, and the other text goes by way of UTF-16. A
// long text of UTF-8 is mapped by tables of what ICU does to each character, which know no language, as its case map.
//
// A result is never shorter than its source: where the mapped text has fewer units, zero units follow it. They are
// real units that count in size() and take part in comparisons.
#include <kvt/string/detail/case_table.h>
#include <kvt/string/detail/instantiate.h>

#include <kvt/encoding/detail/failure_text.h>
#include <kvt/encoding/detail/unicode_vectors.h>
#include <kvt/foundation/detail/append_in_place.h>
#include <kvt/foundation/detail/ascii.h>
#include <kvt/foundation/throwable.h>

#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <limits>
#include <memory>
#include <string>
#include <string_view>

namespace kvt::ex {
namespace {

using Mapping = detail::CaseMapping; // also indexes of the tables below

using CaseMap = std::unique_ptr<UCaseMap, decltype(&ucasemap_close)>;

CaseMap openCaseMap() {
    UErrorCode status = U_ZERO_ERROR;
    CaseMap opened(ucasemap_open("", 0, &status), &ucasemap_close);
    if (status != U_ZERO_ERROR) {
        throw UStringException("Unable to open an ICU case map for the default locale.");
    }
    return opened;
}

/// Closes the map of the process at its exit.
struct ProcessCaseMap {
    ~ProcessCaseMap() { isClosed = true; }

    const CaseMap map = openCaseMap();
    static inline std::atomic<bool> isClosed{false};
};

// Opened at first use and only read after that; when it cannot be opened, the next use tries again. Destructors of
// static objects may map text when it is closed already: they get another one, which stays open.
const UCaseMap* defaultCaseMap() {
    if (ProcessCaseMap::isClosed) {
        static const UCaseMap* const late = openCaseMap().release();
        return late;
    }
    static const ProcessCaseMap process;
    return process.map.get();
}

// The same; null where it cannot be opened.
const UCaseMap* caseMapIfAny() {
    try {
        return defaultCaseMap();
    } catch (const UStringException&) {
        return nullptr;
    }
}

// Whether ICU has written the text, or would have with more room.
bool isUsable(UErrorCode status) {
    return status == U_ZERO_ERROR || status == U_STRING_NOT_TERMINATED_WARNING ||
           status == U_BUFFER_OVERFLOW_ERROR;
}

// Maps `source` with `map`, a function of ICU's shape, into a string that is at least as long as the source. The string
// is made in place, so that the common case costs one allocation.
template <std::uint32_t N, typename Map>
UString<N> icuStringHelper(UStringView<N> source, Map map) {
    UString<N> result;
    if (source.isEmpty()) {
        return result;
    }
    const auto call = [&] {
        UErrorCode status = U_ZERO_ERROR;
        const std::int32_t needed = map(&result[0], static_cast<std::int32_t>(result.size()), source.data(),
                                        static_cast<std::int32_t>(source.size()), &status);
        if (!isUsable(status)) {
            throw UStringException("icuStringHelper() failed");
        }
        return needed;
    };
    result.resize(source.size());
    const std::int32_t needed = call();
    if (needed > 0 && static_cast<std::size_t>(needed) > result.size()) {
        result.resize(static_cast<std::size_t>(needed));
        call();
    }
    return result;
}

/// A text of UTF-8 that is mapped by a table, and by ICU where the table does not know.
class MappingByTable {
public:
    MappingByTable(const detail::CaseTable& table, const UCaseMap* caseMap, std::string_view text)
        : table_(table), caseMap_(caseMap), text_(text) {}

    bool isDone() const { return taken_ == text_.size() && left_.empty(); }

    /// Writes what comes next, as far as there is room, and returns the number of bytes.
    std::size_t write(char* out, std::size_t room) {
        std::size_t written = 0;
        for (;;) {
            const std::size_t copied = std::min(left_.size(), room - written);
            left_.copy(out + written, copied);
            left_.erase(0, copied);
            written += copied;
            if (!left_.empty()) {
                return written;
            }
            const detail::vectors::CaseProgress progress = detail::vectors::mapCase(
                table_, text_.data(), text_.size(), taken_, out + written, room - written);
            taken_ = progress.taken;
            written += progress.written;
            if (!progress.isLeftToIcu) {
                return written;
            }
            askIcu();
        }
    }

    /// How many bytes are still to come.
    std::size_t measure() const {
        MappingByTable rest(*this);
        std::size_t bytes = 0;
        for (std::array<char, 4096> written; !rest.isDone();) {
            bytes += rest.write(written.data(), written.size());
        }
        return bytes;
    }

private:
    // What ICU writes to `out`, which has room for it, measures.
    std::size_t call(std::string_view text, std::string& out) const {
        UErrorCode status = U_ZERO_ERROR;
        const std::int32_t size = detail::caseFunction(table_.mapping)(
            caseMap_, out.data(), static_cast<std::int32_t>(out.size()), text.data(),
            static_cast<std::int32_t>(text.size()), &status);
        if (!isUsable(status)) {
            throw UStringException("icuStringHelper() failed");
        }
        return static_cast<std::size_t>(size);
    }

    // The next character is mapped as its neighbours have it, which none behind a blank are. So ICU sees it with all
    // that stands between two blanks; what of that lies in front is mapped already. Where there is one such character
    // there are more, so that ICU goes some way on.
    void askIcu() {
        constexpr std::size_t someWay = 256;
        const std::size_t blank = text_.substr(0, taken_).find_last_of(' ');
        const std::size_t begin = blank == std::string_view::npos ? 0 : blank + 1;
        const std::size_t end = std::min(text_.find(' ', taken_ + someWay), text_.size());
        const std::string_view asked = text_.substr(begin, end - begin);
        left_.resize(3 * asked.size()); // as long as any mapping gets
        left_.resize(call(asked, left_));
        std::string before(left_.size(), '\0');
        left_.erase(0, call(text_.substr(begin, taken_ - begin), before));
        taken_ = end;
    }

    const detail::CaseTable& table_;
    const UCaseMap* caseMap_;
    std::string_view text_;
    std::size_t taken_ = 0;
    std::string left_; // what ICU gave and was not written yet
};

// The table repays its making after some of such texts. ICU refuses what maps to more than its lengths can say.
constexpr std::size_t leastForTable = 1024;
constexpr std::size_t mostForTable = std::numeric_limits<std::int32_t>::max() / 4;

/// What the text becomes; just as long as it is.
std::string mappedByTable(const detail::CaseTable& table, const UCaseMap* caseMap, std::string_view text) {
    std::string out;
    MappingByTable mapped(table, caseMap, text);
    detail::appendInPlace(out, text.size(), [&](char* to) { return mapped.write(to, text.size()); });
    if (!mapped.isDone()) {
        const std::size_t rest = mapped.measure();
        detail::appendInPlace(out, rest, [&](char* to) { return mapped.write(to, rest); });
    }
    return out;
}

// UTF-16 folds by way of UTF-8 where it is well-formed, for folding is the mapping that no language changes. Empty
// where it is for ICU to do.
std::u16string foldedByTable(std::u16string_view text) {
    const auto bytesOf = [](auto* units) { return reinterpret_cast<const char*>(units); };
    std::u16string out;
    const detail::vectors::Extent extent = detail::vectors::measureUtf16(bytesOf(text.data()), text.size());
    const UCaseMap* const caseMap = extent.taken == text.size() ? caseMapIfAny() : nullptr;
    const detail::CaseTable* const table =
        caseMap != nullptr ? detail::caseTable(Mapping::folded, caseMap) : nullptr;
    if (table == nullptr) {
        return out;
    }
    std::string utf8;
    detail::appendInPlace(utf8, extent.utf8, [&](char* to) {
        return detail::vectors::utf16ToUtf8(bytesOf(text.data()), text.size(), to, extent.utf8);
    });
    utf8 = mappedByTable(*table, caseMap, utf8);
    const std::size_t units = detail::vectors::measureUtf8(utf8.data(), utf8.size()).utf16;
    detail::appendInPlace(out, units, [&](char16_t* to) {
        return detail::vectors::utf8ToUtf16(utf8.data(), utf8.size(), reinterpret_cast<char*>(to), units);
    });
    return out;
}

// `storage` gives the units of a string.
template <typename Storage>
UString<0> mapUtf8(Mapping mapping, UStringView<0> source, Storage storage) {
    const UCaseMap* const caseMap = source.isEmpty() ? nullptr : defaultCaseMap();
    const bool isForTable = source.size() >= leastForTable && source.size() <= mostForTable;
    if (const detail::CaseTable* const table = isForTable ? detail::caseTable(mapping, caseMap) : nullptr) {
        UString<0> result;
        storage(result) = mappedByTable(*table, caseMap, {source.data(), source.size()});
        storage(result).resize(std::max(storage(result).size(), source.size()));
        return result;
    }
    const detail::CaseFunction function = detail::caseFunction(mapping);
    return icuStringHelper(source, [&](char* target, std::int32_t capacity, const char* text,
                                       std::int32_t length, UErrorCode* status) {
        return function(caseMap, target, capacity, text, length, status);
    });
}

template <typename Storage>
UString<2> mapUtf16(Mapping mapping, UStringView<2> source, Storage storage) {
    if (mapping == Mapping::folded && source.size() >= leastForTable && source.size() <= mostForTable / 3) {
        UString<2> result;
        storage(result) = foldedByTable({source.data(), source.size()});
        if (!result.isEmpty()) {
            storage(result).resize(std::max(storage(result).size(), source.size()));
            return result;
        }
    }
    return icuStringHelper(source, [&](char16_t* target, std::int32_t capacity, const char16_t* text,
                                       std::int32_t length, UErrorCode* status) {
        switch (mapping) {
        case Mapping::upper:
            return u_strToUpper(target, capacity, text, length, nullptr, status);
        case Mapping::lower:
            return u_strToLower(target, capacity, text, length, nullptr, status);
        default:
            return u_strFoldCase(target, capacity, text, length, U_FOLD_CASE_DEFAULT, status);
        }
    });
}

constexpr std::array utf8Contexts = {
    "UString<Encoding::Utf8>::toUpperCase() failed on ",
    "UString<Encoding::Utf8>::toLowerCase() failed on ",
    "UString<Encoding::Utf8>::toFoldedCase() failed on ",
};

constexpr std::array utf16Contexts = {
    "UString<Encoding::Utf16>::toUpperCase() failed on ",
    "UString<Encoding::Utf16>::toLowerCase() failed on ",
    "UString<Encoding::Utf16>::toFoldedCase() failed on ",
};

// Runs `action`; a failure that leaves it carries a line with the text, and one of a foreign kind becomes fatal.
template <typename Action>
auto guarded(const char* context, std::string_view bytes, Encoding encoding, Action action) {
    const auto addContext = [&](Throwable& failure) {
        const UString<0> text = detail::textForFailure(bytes, encoding);
        std::string line(context);
        line.append(text.rawData(), text.size());
        failure.addMessageString(UString<0>(UStringView<0>(line)));
    };
    try {
        return action();
    } catch (Throwable& failure) {
        addContext(failure);
        throw;
    } catch (...) {
        FatalError failure(UString<0>("Exception of unexpected type encountered"));
        addContext(failure);
        throw failure;
    }
}

template <Mapping mapping>
char mapAscii(char byte) {
    return mapping == Mapping::upper ? detail::asciiUpper(byte) : detail::asciiLower(byte);
}

// Maps a UTF-16 string, and from there every other one that is not mapped in its own form.
template <Mapping mapping>
UString<2> mapped(const UString<2>& text) {
    if constexpr (mapping == Mapping::upper) {
        return text.getAsUpperCase();
    } else if constexpr (mapping == Mapping::lower) {
        return text.getAsLowerCase();
    } else {
        return text.getAsFoldedCase();
    }
}

// The mapped copy of a view. `name` is the member that was called; `storage` gives the units of a string.
template <std::uint32_t N, Mapping mapping, typename Storage>
UString<N> map(UStringView<N> view, const char* name, Storage storage) {
    constexpr auto index = static_cast<std::size_t>(mapping);
    using Unit = detail::CodeUnit<N>;
    const std::string_view bytes(reinterpret_cast<const char*>(view.data()), view.size() * sizeof(Unit));
    constexpr auto encoding = static_cast<Encoding::Type>(N);
    if constexpr (N == Encoding::Binary) {
        throw UStringNotImplementedException(name);
    } else if constexpr (N == Encoding::Utf8) {
        return guarded(utf8Contexts[index], bytes, encoding, [&] { return mapUtf8(mapping, view, storage); });
    } else if constexpr (N == Encoding::Utf16LE) {
        return guarded(utf16Contexts[index], bytes, encoding,
                       [&] { return mapUtf16(mapping, view, storage); });
    } else if constexpr (N == Encoding::UsAscii) {
        UString<N> result(view);
        std::transform(result.begin(), result.end(), &result[0], mapAscii<mapping>);
        return result;
    } else {
        // A view of a UString<30> has no encoding, so that this conversion refuses it.
        return UString<N>(mapped<mapping>(UString<2>(bytes.data(), bytes.size(), encoding)));
    }
}

} // namespace

template <std::uint32_t N>
UString<N> UString<N>::getAsUpperCase(UStringView<N> text) {
    return map<N, Mapping::upper>(
        text, "getAsUpperCase", [](UString & string) -> auto& { return string.storage_; });
}

template <std::uint32_t N>
UString<N> UString<N>::getAsLowerCase(UStringView<N> text) {
    return map<N, Mapping::lower>(
        text, "getAsLowerCase", [](UString & string) -> auto& { return string.storage_; });
}

template <std::uint32_t N>
UString<N> UString<N>::getAsFoldedCase(UStringView<N> text) {
    return map<N, Mapping::folded>(
        text, "getAsFoldedCase", [](UString & string) -> auto& { return string.storage_; });
}

template <std::uint32_t N>
UString<N> UString<N>::getAsUpperCase() const {
    return getAsUpperCase(*this);
}

template <std::uint32_t N>
UString<N> UString<N>::getAsLowerCase() const {
    return getAsLowerCase(*this);
}

template <std::uint32_t N>
UString<N> UString<N>::getAsFoldedCase() const {
    return getAsFoldedCase(*this);
}

template <std::uint32_t N>
void UString<N>::toUpperCase() {
    if constexpr (N == Encoding::UsAscii) {
        std::transform(this->storage_.begin(), this->storage_.end(), this->storage_.begin(),
                       mapAscii<Mapping::upper>);
    } else {
        *this = map<N, Mapping::upper>(
            *this, "toUpperCase", [](UString & string) -> auto& { return string.storage_; });
    }
}

template <std::uint32_t N>
void UString<N>::toLowerCase() {
    if constexpr (N == Encoding::UsAscii) {
        std::transform(this->storage_.begin(), this->storage_.end(), this->storage_.begin(),
                       mapAscii<Mapping::lower>);
    } else {
        *this = map<N, Mapping::lower>(
            *this, "toLowerCase", [](UString & string) -> auto& { return string.storage_; });
    }
}

template <std::uint32_t N>
void UString<N>::toFoldedCase() {
    if constexpr (N == Encoding::UsAscii) {
        toLowerCase();
    } else {
        *this = map<N, Mapping::folded>(
            *this, "toFoldedCase", [](UString & string) -> auto& { return string.storage_; });
    }
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
