// ICU's converters as this library uses them. icu.cpp behind this header is the only source of the folder that
// includes ICU; no header does.
#pragma once

#include <kvt/encoding/detail/shortcut.h>
#include <kvt/encoding/encoding.h>

#include <cstddef>
#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct UConverter;

namespace kvt::ex::detail::icu {

/// The canonical name behind any name that ICU knows: the MIME name, else the IANA name, else ICU's own. Empty when
/// ICU cannot open the name.
std::string standardName(const char* name);

/// ICU's name of an error code, as "U_ILLEGAL_ARGUMENT_ERROR".
std::string_view errorName(int error);

/// Is told of what a converter cannot convert, before the converter writes its substitution. The calls come from
/// within ICU and must not throw.
class LossListener {
public:
    /// Bytes that are not text; `target` is where the substitution is about to be written, `error` ICU's code.
    virtual void onBadInput(std::string_view bytes, const char16_t* target, int error) noexcept = 0;
    /// A character without a form in the converter's encoding.
    virtual void onNotRepresentable(char32_t codePoint, int error) noexcept = 0;

protected:
    ~LossListener() = default;
};

/// How a step of a conversion ended.
struct Progress {
    enum End { inputTaken, outputFull, failed };
    End end;
    int error; ///< ICU's code when `end` is `failed`
};

/// Owns one ICU converter. What cannot be converted is replaced by U+FFFD in the Unicode forms and by "?" in all
/// other encodings.
class Converter {
public:
    /// No converter.
    Converter() noexcept = default;
    /// Opens the converter of `encoding`, if ICU can.
    explicit Converter(Encoding encoding);

    bool isOpen() const noexcept { return converter_ != nullptr; }
    /// Sends losses to `listener`, which must outlive the converter or the next call.
    void setListener(LossListener& listener);
    void reset();

    /// Throws std::bad_alloc where that is why it is not open, for those who keep what they find out.
    void requireMemory() const;

    /// The bytes of the longest character.
    int maxCharSize() const;
    /// The bytes that stand for a lost character; empty when ICU does not know.
    std::string substitution() const;
    /// How text of this encoding can be converted without ICU. Not to be called within a conversion. Throws
    /// std::bad_alloc.
    Form form();

    struct Range {
        char32_t first;
        char32_t last;
    };
    /// The characters that the encoding has, and perhaps some that only resemble one of them, in order.
    std::vector<Range> characters() const;

    /// What cannot be asked of ICU, found out by some conversions.
    struct Nature {
        /// Whether nothing but the beginning of a character is ever carried from one piece of text to the next.
        bool isStateless;
        /// Whether a character comes out only when the next one is read, and its bytes are not counted as held.
        bool isBehind;
    };
    Nature nature() const;
    /// A converter in the same state, with the same listener; not open when ICU cannot copy this one.
    Converter clone() const;

    /// Bytes held as the beginning of a character, none where the converter does not count them.
    std::size_t heldBytes() const;
    bool countsHeldBytes() const;
    /// The last bytes of a text that ends here where they are the beginning of something, and ICU would drop them
    /// without a word.
    std::size_t forgottenBytes() const;
    /// Whether UTF-16 is held of which the output has not been given yet.
    bool holdsUnits() const;

    /// From bytes to UTF-16. `source` and `target` are moved on.
    Progress toUnicode(const char*& source, const char* sourceEnd, char16_t*& target,
                       const char16_t* targetEnd, bool flush);
    /// From UTF-16 to bytes.
    Progress fromUnicode(const char16_t*& source, const char16_t* sourceEnd, char*& target,
                         const char* targetEnd, bool flush);

    /// From bytes of `from` to bytes of `to`, by way of a pivot that carries text from call to call.
    static Progress convert(Converter& to, Converter& from, char*& target, const char* targetEnd,
                            const char*& source, const char* sourceEnd, char16_t* pivot,
                            char16_t*& pivotSource, char16_t*& pivotTarget, const char16_t* pivotEnd,
                            bool reset, bool flush);

private:
    struct Close {
        void operator()(UConverter* converter) const noexcept;
    };

    bool forgetsToReset() const;
    /// What further bytes would come to; nothing where they are bad input.
    std::optional<std::u16string> whatFollows(std::string_view bytes) const;

    std::unique_ptr<UConverter, Close> converter_;
    Encoding encoding_ = Encoding::Unknown;
    LossListener* listener_ = nullptr;
    bool lacksMemory_ = false; ///< that is why it is not open
};

} // namespace kvt::ex::detail::icu
