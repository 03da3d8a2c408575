// Case mapping. ICU maps UTF-8 and UTF-16 directly, ASCII is mapped here, and the other text goes by way of UTF-16.
//
// A result is never shorter than its source: where the mapped text has fewer units, zero units follow it. They are
// real units that count in size() and take part in comparisons.
#include <kvt/string/detail/instantiate.h>

#include <kvt/encoding/detail/failure_text.h>
#include <kvt/foundation/detail/ascii.h>
#include <kvt/foundation/throwable.h>

#include <unicode/ucasemap.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <array>
#include <atomic>
#include <memory>

namespace kvt::ex {
namespace {

/// The mappings, as indexes of the tables below.
enum class Mapping { upper, lower, folded };

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

// Opened at first use and only read after that; when it cannot be opened, the next use tries again. Destructors of static
// objects may map text when it is closed already: they get another one, which stays open.
const UCaseMap* defaultCaseMap() {
    if (ProcessCaseMap::isClosed) {
        static const UCaseMap* const late = openCaseMap().release();
        return late;
    }
    static const ProcessCaseMap process;
    return process.map.get();
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

UString<0> mapUtf8(Mapping mapping, UStringView<0> source) {
    const UCaseMap* const caseMap = source.isEmpty() ? nullptr : defaultCaseMap();
    return icuStringHelper(source, [&](char* target, std::int32_t capacity, const char* text,
                                       std::int32_t length, UErrorCode* status) {
        switch (mapping) {
        case Mapping::upper:
            return ucasemap_utf8ToUpper(caseMap, target, capacity, text, length, status);
        case Mapping::lower:
            return ucasemap_utf8ToLower(caseMap, target, capacity, text, length, status);
        default:
            return ucasemap_utf8FoldCase(caseMap, target, capacity, text, length, status);
        }
    });
}

UString<2> mapUtf16(Mapping mapping, UStringView<2> source) {
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

// The mapped copy of a view. `name` is the member that was called.
template <std::uint32_t N, Mapping mapping>
UString<N> map(UStringView<N> view, const char* name) {
    constexpr auto index = static_cast<std::size_t>(mapping);
    using Unit = detail::CodeUnit<N>;
    const std::string_view bytes(reinterpret_cast<const char*>(view.data()), view.size() * sizeof(Unit));
    constexpr auto encoding = static_cast<Encoding::Type>(N);
    if constexpr (N == Encoding::Binary) {
        throw UStringNotImplementedException(name);
    } else if constexpr (N == Encoding::Utf8) {
        return guarded(utf8Contexts[index], bytes, encoding, [&] { return mapUtf8(mapping, view); });
    } else if constexpr (N == Encoding::Utf16LE) {
        return guarded(utf16Contexts[index], bytes, encoding, [&] { return mapUtf16(mapping, view); });
    } else if constexpr (N == Encoding::UsAscii) {
        UString<N> result(view);
        std::transform(result.begin(), result.end(), &result[0], mapAscii<mapping>);
        return result;
    } else {
        // A view of a UString<30> has no encoding, so that this conversion refuses it.
        return UString<N>(mapped<mapping>(UString<2>(bytes.data(), bytes.size(), encoding)));
    }
}

// The same in place. A UString<30> converts the result into its own encoding.
template <Mapping mapping, std::uint32_t N>
UString<N> mapInto(const UString<N>& string, const char* name) {
    UString<N> result = map<N, mapping>(string, name);
    if constexpr (N == Encoding::Unknown) {
        return result.getAsEncoding(string.encoding());
    }
    return result;
}

} // namespace

template <std::uint32_t N>
UString<N> UString<N>::getAsUpperCase(UStringView<N> text) {
    return map<N, Mapping::upper>(text, "getAsUpperCase");
}

template <std::uint32_t N>
UString<N> UString<N>::getAsLowerCase(UStringView<N> text) {
    return map<N, Mapping::lower>(text, "getAsLowerCase");
}

template <std::uint32_t N>
UString<N> UString<N>::getAsFoldedCase(UStringView<N> text) {
    return map<N, Mapping::folded>(text, "getAsFoldedCase");
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
        *this = mapInto<Mapping::upper>(*this, "toUpperCase");
    }
}

template <std::uint32_t N>
void UString<N>::toLowerCase() {
    if constexpr (N == Encoding::UsAscii) {
        std::transform(this->storage_.begin(), this->storage_.end(), this->storage_.begin(),
                       mapAscii<Mapping::lower>);
    } else {
        *this = mapInto<Mapping::lower>(*this, "toLowerCase");
    }
}

template <std::uint32_t N>
void UString<N>::toFoldedCase() {
    if constexpr (N == Encoding::UsAscii) {
        toLowerCase();
    } else {
        *this = mapInto<Mapping::folded>(*this, "toFoldedCase");
    }
}

KVT_FOR_EACH_USTRING(KVT_INSTANTIATE_USTRING)

} // namespace kvt::ex
