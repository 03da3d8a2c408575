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

// A match says how many groups there are, and with one alternative more the pattern matches the empty text.
std::size_t countGroups(const std::string& pattern) {
    return URegex<0>(Utf8String(View("(?:)|" + pattern))).match(Utf8String()).groupCount() - 1;
}

class PerlPattern : public LinePattern {
public:
    explicit PerlPattern(const std::string& pattern)
        : regex_(Utf8String(View(pattern))), groupCount_(countGroups(pattern)) {}

    bool find(std::string_view line) override { return regex_.matchesIn(View(line)); }
    std::size_t passOver(std::string_view lines) const override { return regex_.passOver(View(lines)); }

    void findAll(std::string_view line, const TakeMatch& take) override {
        regex_.searchAll(subject(line), [&](const URegexMatch<0>& match) {
            places_.clear();
            for (const auto& [position, length] : match.groups()) {
                const bool tookPart = position != Utf8String::npos;
                // A look ahead may move the beginning of a match behind its end, by \K.
                const bool isForward = length <= line.size();
                places_.push_back(tookPart ? std::optional(GroupPlace{position, isForward ? length : 0})
                                           : std::nullopt);
            }
            return take(places_);
        });
    }

    std::size_t groupCount() const override { return groupCount_; }

private:
    // The same string for every line, so that it is allocated for the longest ones only.
    const Utf8String& subject(std::string_view line) {
        subject_.clear();
        subject_.append(View(line));
        return subject_;
    }

    URegex<0> regex_;
    std::size_t groupCount_;
    Utf8String subject_;
    GroupPlaces places_;
};

class LegacyPattern : public LinePattern {
public:
    explicit LegacyPattern(const std::string& pattern) : regexp_(pattern.data(), pattern.size()) {}

    bool find(std::string_view line) override { return place(line).has_value(); }

    void findAll(std::string_view line, const TakeMatch& take) override {
        if (const std::optional<GroupPlace> found = place(line)) {
            take({found});
        }
    }

private:
    std::optional<GroupPlace> place(std::string_view line) const {
        std::uint64_t length = 0;
        const std::uint64_t position = regexp_.index(line.data(), line.size(), &length, 0);
        return position == ObsoleteRegexp::npos ? std::nullopt : std::optional(GroupPlace{position, length});
    }

    ObsoleteRegexp regexp_;
};

std::unique_ptr<LinePattern> compileByLibrary(const std::string& pattern, Dialect dialect,
                                              LetterCase letterCase) {
    try {
        if (dialect == Dialect::Legacy) {
            return std::make_unique<LegacyPattern>(pattern);
        }
        // By itself first, so that its faults are its own.
        auto compiled = std::make_unique<PerlPattern>(pattern);
        return letterCase == LetterCase::Distinguish ? std::move(compiled)
                                                     : std::make_unique<PerlPattern>("(?i)" + pattern);
    } catch (const std::runtime_error& failure) {
        throw Failure("REGEX cannot be compiled: " + printable(failure.what()));
    }
}

} // namespace

std::unique_ptr<LinePattern> compilePattern(const std::string& pattern, Dialect dialect,
                                            LetterCase letterCase) {
    requireUtf8("REGEX", pattern);
    return dialect == Dialect::Unicode ? compileUnicodePattern(pattern, letterCase)
                                       : compileByLibrary(pattern, dialect, letterCase);
}

} // namespace host
