#include "text/line_pattern.h"

#include "base/failure.h"
#include "base/text.h"

#include <kvt/regex/obsolete_regexp.h>
#include <kvt/regex/uregex.h>
#include <kvt/string/ustring.h>

#include <cstdint>
#include <stdexcept>

namespace host {

namespace {

using kvt::ex::URegex;
using kvt::ex::URegexMatch;
using kvt::ex::Utf8String;
using View = kvt::ex::UStringView<kvt::ex::Encoding::Utf8>;

class PerlPattern : public LinePattern {
public:
    explicit PerlPattern(const Utf8String& pattern) : regex_(pattern) {}

    bool find(std::string_view line, GroupPlaces* groups) override {
        // The same string for every line, so that it is allocated for the longest ones only.
        subject_.clear();
        subject_.append(View(line));
        const URegexMatch<0> match = regex_.search(subject_);
        if (groups != nullptr) {
            groups->clear();
            for (const auto& [position, length] : match.groups()) {
                const bool tookPart = position != Utf8String::npos;
                groups->push_back(tookPart ? std::optional(GroupPlace{position, length}) : std::nullopt);
            }
        }
        return match.matched();
    }

private:
    URegex<0> regex_;
    Utf8String subject_;
};

class LegacyPattern : public LinePattern {
public:
    explicit LegacyPattern(const std::string& pattern) : regexp_(pattern.data(), pattern.size()) {}

    bool find(std::string_view line, GroupPlaces* groups) override {
        std::uint64_t length = 0;
        const std::uint64_t position = regexp_.index(line.data(), line.size(), &length, 0);
        if (position == ObsoleteRegexp::npos) {
            return false;
        }
        if (groups != nullptr) {
            groups->assign(1, GroupPlace{position, length});
        }
        return true;
    }

private:
    ObsoleteRegexp regexp_;
};

} // namespace

std::unique_ptr<LinePattern> compilePattern(const std::string& pattern, Dialect dialect) {
    const Utf8String text{View(pattern)};
    text.getAsUtf32(); // which looks at every byte
    try {
        if (dialect == Dialect::Legacy) {
            return std::make_unique<LegacyPattern>(pattern);
        }
        return std::make_unique<PerlPattern>(text);
    } catch (const std::runtime_error& failure) {
        throw Failure("REGEX cannot be compiled: " + printable(failure.what()));
    }
}

} // namespace host
