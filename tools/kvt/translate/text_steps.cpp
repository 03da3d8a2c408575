// The steps that are about text: replace, case, strip, normalize.

#include "translate/cell_step.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"
#include "cli/choices.h"
#include "text/line_pattern.h"
#include "text/match_print.h"
#include "translate/icu_data.h"

#include <kvt/string/ustring.h>

#include <algorithm>
#include <stdexcept>

namespace host {

namespace {

using kvt::ex::Utf8String;
using View = kvt::ex::UStringView<kvt::ex::Encoding::Utf8>;

class ReplaceStep : public CellStep {
public:
    ReplaceStep(std::string column, const std::string& regex, const std::string& text)
        : CellStep(std::move(column)), pattern_(compileUnicodePattern(regex, LetterCase::Distinguish)),
          replacement_(text, pattern_->groupCount()) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        result_.clear();
        std::size_t done = 0;
        try {
            pattern_->findAll(text, [&](const GroupPlaces& groups) {
                const GroupPlace& whole = *groups.front();
                result_.append(text.substr(done, whole.position - done));
                replacement_.append(text, groups, result_);
                done = whole.position + whole.length;
                return true;
            });
        } catch (const std::runtime_error&) {
            fail(row, makeProblem(problem_number::regexTakesTooLong, {std::string(text)}));
            return;
        }
        result_.append(text.substr(done));
        set(row, result_);
    }

private:
    std::unique_ptr<LinePattern> pattern_;
    Replacement replacement_;
    std::string result_;
};

enum class Change { Upper, Lower, Fold };

class CaseStep : public CellStep {
public:
    CaseStep(std::string column, Change change) : CellStep(std::move(column)), change_(change) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        const View view(text);
        const Utf8String changed = change_ == Change::Upper   ? Utf8String::getAsUpperCase(view)
                                   : change_ == Change::Lower ? Utf8String::getAsLowerCase(view)
                                                              : Utf8String::getAsFoldedCase(view);
        // Where the mapping shrinks, zeros fill it up; the cell itself has none.
        const std::string_view all(changed.rawData(), changed.size());
        keep(row, all.substr(0, all.find('\0')));
    }

private:
    Change change_;
};

class StripStep : public CellStep {
public:
    StripStep(std::string column, const std::string& characters) : CellStep(std::move(column)) {
        const std::u32string all = toUtf32(characters, kvt::ex::Encoding::Utf8);
        for (const char32_t character : all) {
            characters_.push_back(toUtf8(std::u32string_view(&character, 1)));
        }
    }

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        const auto isOneOf = [&](auto test) {
            return std::find_if(characters_.begin(), characters_.end(), test);
        };
        for (auto found = characters_.begin(); found != characters_.end();) {
            found = isOneOf([&](const std::string& one) { return text.starts_with(one); });
            text.remove_prefix(found == characters_.end() ? 0 : found->size());
        }
        for (auto found = characters_.begin(); found != characters_.end();) {
            found = isOneOf([&](const std::string& one) { return text.ends_with(one); });
            text.remove_suffix(found == characters_.end() ? 0 : found->size());
        }
        set(row, text);
    }

private:
    std::vector<std::string> characters_;
};

class NormalizeStep : public CellStep {
public:
    NormalizeStep(std::string column, std::unique_ptr<Normalizer> normalizer)
        : CellStep(std::move(column)), normalizer_(std::move(normalizer)) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        if (!std::all_of(text.begin(), text.end(), isAscii)) {
            keep(row, normalizer_->normalized(text));
        }
    }

private:
    std::unique_ptr<Normalizer> normalizer_;
};

// The white space of Unicode.
constexpr const char* whiteSpace =
    "\t\n\v\f\r "
    "\u0085\u00A0\u1680\u2000\u2001\u2002\u2003\u2004\u2005\u2006\u2007\u2008\u2009\u200A\u2028\u2029"
    "\u202F\u205F\u3000";

} // namespace

std::unique_ptr<Step> makeReplaceStep(const StepValues& values) {
    return std::make_unique<ReplaceStep>(values.get("column"), values.get("regex"), values.get("text"));
}

std::unique_ptr<Step> makeCaseStep(const StepValues& values) {
    static const Choices<Change> changes = {
        {"upper", Change::Upper}, {"lower", Change::Lower}, {"fold", Change::Fold}};
    return std::make_unique<CaseStep>(values.get("column"),
                                      choose("the change", values.get("change"), changes));
}

std::unique_ptr<Step> makeStripStep(const StepValues& values) {
    const std::string& characters = values.get("characters");
    return std::make_unique<StripStep>(values.get("column"), characters.empty() ? whiteSpace : characters);
}

std::unique_ptr<Step> makeNormalizeStep(const StepValues& values) {
    const std::string form = values.get("form").empty() ? "nfc" : values.get("form");
    static const Choices<int> forms = {{"nfc", 0}, {"nfd", 0}, {"nfkc", 0}, {"nfkd", 0}};
    choose("the normal form", form, forms);
    return std::make_unique<NormalizeStep>(values.get("column"), makeNormalizer(form));
}

} // namespace host
