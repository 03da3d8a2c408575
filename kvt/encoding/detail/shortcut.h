// Conversion without ICU, where a shorter way gives the same bytes and the same failures.
//
// This is the one place that decides. The caller converts a prefix here and gives ICU the rest:
//
// - between two Unicode forms, as far as the input is well-formed and complete;
// - between a code page and a Unicode form or another code page, as far as the tables of detail/conversion_tables.h go;
// - between any two encodings that keep ASCII as it is, as far as the input is ASCII.
//
// What is taken here is text that converts without any loss, so nothing has to be reported, and it ends at a
// character boundary in the initial state of both converters, so ICU can go on from there.
#pragma once

#include <kvt/encoding/detail/form.h>
#include <kvt/encoding/encoding.h>

#include <cstddef>
#include <functional>
#include <string>
#include <string_view>

namespace kvt::ex::detail {

class EncodingProfile;

/// The source or the target of a conversion.
struct Side {
    Form form = Form::other;
    EncodingProfile* profile = nullptr; ///< where the form is one with tables
};

/// Converts the longest prefix of the bytes `in` that needs no ICU, appends it to `out`, and returns the bytes taken
/// from `in`; 0 when there is no shorter way between the two sides. Two sides of one encoding have to be Unicode forms.
/// A unit of `out` must be as wide as the target's or be a byte; otherwise nothing is converted. Where a table is not
/// built, only ASCII is.
template <typename CharOut>
std::size_t convertPrefix(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out);

/// The same for a text that convertShort() was offered and did not take.
template <typename CharOut>
std::size_t convertPieces(Side from, Side to, std::string_view in, std::basic_string<CharOut>& out);

/// Converts the first characters of UTF-8 to another Unicode form, one by one: as many as begin in the first few bytes, up
/// to one that is not well-formed and complete. That is faster than registers where a text has bad bytes everywhere.
/// Returns the bytes taken, 0 for other forms.
std::size_t convertFew(Side from, Side to, std::string_view in, std::string& out);

/// Is given a character that the target may lack and the bytes of the text before it, and returns what stands in its
/// place; null where only ICU knows.
using LoseCharacter = std::function<const std::string*(std::string_view character, std::size_t offset)>;

/// As convertPrefix(), to a target that is none of the Unicode forms, and going on behind characters that `lose` knows.
/// All tables of the two sides are there.
std::size_t convertLossy(Side from, Side to, std::string_view in, std::string& out,
                         const LoseCharacter& lose);

/// The bytes in front of `in` that ICU takes for one piece of bad input, where that is known without it: at the beginning
/// of what is no character, whatever follows. 0 where it is not.
std::size_t malformedLength(Side from, std::string_view in);

/// The bytes of the first character of `in`, if it is known without ICU to be well-formed and complete; else 0.
std::size_t characterLength(Side from, std::string_view in);

/// Builds the tables that are missing between two sides where that is worth it, for a text of which convertPrefix()
/// left `bytes`. Returns whether it can go on behind what ICU has to look at: the forms are known, and all tables are
/// there.
bool canGoOn(Side from, Side to, std::size_t bytes);

#define KVT_DECLARE(CharOut)                                                                                 \
    extern template std::size_t convertPrefix(Side, Side, std::string_view, std::basic_string<CharOut>&);    \
    extern template std::size_t convertPieces(Side, Side, std::string_view, std::basic_string<CharOut>&);

KVT_DECLARE(char)
KVT_DECLARE(char16_t)
KVT_DECLARE(char32_t)

#undef KVT_DECLARE

} // namespace kvt::ex::detail
