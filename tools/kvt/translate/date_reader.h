// Dates and times in any of several forms, made canonical. What a form takes is what the library's parse() takes by it;
// here it has to take the whole text, and may have two things more: years of two digits, and names of months in
// another language.
#pragma once

#include "translate/fixed_date.h"
#include "translate/problem.h"

#include <kvt/string/ustring.h>

#include <cstddef>
#include <optional>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace host {

/// Names of months by which texts are looked through.
class MonthNames {
public:
    /// Throws Failure for a language that ICU does not know.
    explicit MonthNames(const std::string& language);

    /// The month, from 0, whose name stands at the beginning of the text, in any case, and the bytes of it; of several
    /// names the longest.
    std::optional<std::pair<std::size_t, std::size_t>> find(std::string_view text) const;

private:
    struct Name {
        std::string folded;
        std::size_t size; ///< bytes of it as it is written
        std::size_t month;
    };
    std::vector<Name> names_;
    std::size_t longest_ = 0;
};

class DateReader {
public:
    /// `formats` are patterns and keywords with "|" between them. A `pivot`, two digits, is for "%y"; without a
    /// language, months have English names. Throws Failure.
    DateReader(const std::string& formats, const std::string& pivot, const std::string& language);

    /// The canonical text in `out`, valid until the next one is read. False, with the problem by the form that fits best,
    /// where none fits.
    bool read(std::string_view text, std::string_view& out, Problem& problem);
    /// The first form, by which a text is read that fits it, if it has a fixed length.
    const std::optional<FixedDateForm>& fixedForm() const { return forms_.front().fixed; }

private:
    struct Form {
        std::string typed;
        kvt::ex::UString<0> format; ///< as the library gets it
        std::optional<FixedDateForm> fixed;
        std::optional<FixedDateText> canonical; ///< of texts in the fixed form
        bool isRewritten = false;               ///< texts become such as the library reads
    };

    /// Why a form does not fit, and how much of it does.
    struct Misfit {
        std::size_t fit = 0;
        Problem problem;
    };

    Form makeForm(const std::string& typed) const;
    bool readBy(Form& form, std::string_view text, std::string_view& out, Misfit* misfit);
    bool readByLibrary(const Form& form, std::string_view text, std::string_view& out, Misfit* misfit);
    std::optional<std::size_t> rewrite(std::string_view pattern, std::string_view text);

    std::vector<Form> forms_;
    std::optional<int> pivot_;
    std::optional<MonthNames> months_;
    kvt::ex::UString<0> value_;
    std::string rewritten_;
    std::string canonical_;
};

} // namespace host
