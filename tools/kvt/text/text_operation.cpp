#include "text/text_operation.h"

#include "base/failure.h"

#include <kvt/foundation/vector.h>
#include <kvt/string/ustring.h>
#include <kvt/string/ustring_array.h>

#include <nlohmann/json.hpp>

#include <cstdint>
#include <utility>

namespace host {

namespace {

using kvt::ex::Utf32String;
using kvt::ex::Utf8String;
using View = kvt::ex::UStringView<kvt::ex::Encoding::Utf8>;

Utf8String needleOf(const std::string& argument, const char* name) {
    if (argument.empty()) {
        throw Failure(std::string(name) + " must not be empty");
    }
    return Utf8String(View(argument));
}

std::size_t trailingZeros(std::string_view text) {
    const std::size_t last = text.find_last_not_of('\0');
    return last == std::string_view::npos ? text.size() : text.size() - last - 1;
}

// A mapped string is never shorter than its source: zero units fill it up where the mapping shrinks. Only
// U+0000 maps to zero units and it maps to itself, so that the true text ends with just as many of them as
// the source does, and what there is beyond that is the filling.
Utf8String withoutFilling(Utf8String mapped, std::string_view source) {
    mapped.resize(mapped.size() - trailingZeros(mapped) + trailingZeros(source));
    return mapped;
}

Utf8String mapped(CaseChange change, std::string_view text) {
    switch (change) {
    case CaseChange::Upper:
        return withoutFilling(Utf8String::getAsUpperCase(View(text)), text);
    case CaseChange::Lower:
        return withoutFilling(Utf8String::getAsLowerCase(View(text)), text);
    default:
        return withoutFilling(Utf8String::getAsFoldedCase(View(text)), text);
    }
}

void append(std::string& out, const Utf8String& text) {
    out.append(text.rawData(), text.size());
}

// The way back from positions in a folded text to those in the text itself. Folding takes each character for
// itself, whatever stands around it, so that walking over both texts character by character keeps them in
// step.
class FoldedWalk {
public:
    explicit FoldedWalk(std::string_view text) : text_(text) {}

    /// Goes on to the first character that does not begin before `folded`, or to the end of the text.
    void advanceTo(std::uint64_t folded) {
        while (folded_ < folded && position_ < text_.size()) {
            const std::size_t length = characterLength(text_[position_]);
            const std::string_view character = text_.substr(position_, length);
            folded_ += length == 1 ? 1 : mapped(CaseChange::Fold, character).size();
            position_ += length;
        }
    }

    std::uint64_t folded() const { return folded_; }
    std::size_t position() const { return position_; }

private:
    // By the first byte of a character in valid UTF-8.
    static std::size_t characterLength(char first) {
        const auto byte = static_cast<unsigned char>(first);
        return byte < 0x80 ? 1 : byte < 0xE0 ? 2 : byte < 0xF0 ? 3 : 4;
    }

    std::string_view text_;
    std::uint64_t folded_ = 0;
    std::size_t position_ = 0;
};

// The places of a needle in a line, from the left, none within the one before.
//
// The library's own search without regard to case gives positions in the folded text, folds again at each
// call, and counts the filling of a folded needle. Here both sides are folded once, without filling, and each
// match is traced back to the characters that it came from; one that covers half a character ("s" in "ß",
// which folds to "ss") does not count.
class Matcher {
public:
    Matcher(Utf8String needle, CaseRule rule) : needle_(std::move(needle)), rule_(rule) {
        if (rule == CaseRule::Ignore) {
            needle_ = mapped(CaseChange::Fold, needle_);
        }
    }

    /// Calls onMatch(position, size), in bytes of the line.
    template <typename OnMatch>
    void forEach(std::string_view line, const OnMatch& onMatch) const {
        if (rule_ == CaseRule::Ignore) {
            forEachFolded(line, onMatch);
            return;
        }
        const Utf8String text{View(line)};
        for (auto at = text.find(needle_); at != Utf8String::npos;
             at = text.find(needle_, at + needle_.size())) {
            onMatch(at, needle_.size());
        }
    }

private:
    template <typename OnMatch>
    void forEachFolded(std::string_view line, const OnMatch& onMatch) const {
        const Utf8String folded = mapped(CaseChange::Fold, line);
        FoldedWalk start(line);
        for (auto at = folded.find(needle_); at != Utf8String::npos;) {
            start.advanceTo(at);
            FoldedWalk end = start;
            end.advanceTo(at + needle_.size());
            const bool whole = start.folded() == at && end.folded() == at + needle_.size();
            if (whole) {
                onMatch(start.position(), end.position() - start.position());
            }
            at = folded.find(needle_, at + (whole ? needle_.size() : 1));
        }
    }

    Utf8String needle_;
    CaseRule rule_;
};

// The line with `to` in the place of every match.
Utf8String replaced(const Matcher& matcher, const TextLine& line, View to) {
    Utf8String result;
    std::size_t done = 0;
    matcher.forEach(line.text, [&](std::size_t position, std::size_t size) {
        result.append(View(line.text.substr(done, position - done))).append(to);
        done = position + size;
    });
    result.append(View(line.text.substr(done)));
    return result;
}

class Case : public TextOperation {
public:
    explicit Case(CaseChange change) : change_(change) {}
    void apply(const TextLine& line, std::string& out) const override {
        append(out, mapped(change_, line.text));
        out += line.end;
    }

private:
    CaseChange change_;
};

class Find : public TextOperation {
public:
    Find(Utf8String needle, CaseRule rule, Statements form)
        : matcher_(std::move(needle), rule), form_(form) {}
    void apply(const TextLine& line, std::string& out) const override {
        matcher_.forEach(line.text, [&](std::size_t position, std::size_t size) {
            const Place place = line.placeOf(position);
            if (form_ == Statements::Records) {
                nlohmann::ordered_json record;
                record["file"] = place.file;
                record["line"] = place.line;
                record["column"] = place.column;
                record["offset"] = place.offset;
                record["text"] = line.text.substr(position, size);
                out += record.dump();
            } else {
                appendPlace(place, form_ == Statements::LinesWithFile, out);
            }
            out += '\n';
        });
    }
    bool givesText() const override { return false; }
    bool asksForPlaces() const override { return true; }

private:
    Matcher matcher_;
    Statements form_;
};

class Replace : public TextOperation {
public:
    Replace(const Utf8String& from, Utf8String to, CaseRule rule)
        : matcher_(from, rule), to_(std::move(to)) {}
    void apply(const TextLine& line, std::string& out) const override {
        append(out, replaced(matcher_, line, to_));
        out += line.end;
    }

private:
    Matcher matcher_;
    Utf8String to_;
};

// The library's split consumes one unit of a delimiter, however long that is. As no line holds a LF, a LF in
// the place of every delimiter makes it a unit, and the split leaves nothing of it.
class Split : public TextOperation {
public:
    Split(const Utf8String& delimiter, CaseRule rule, bool skipEmpty)
        : matcher_(delimiter, rule),
          behaviour_(skipEmpty ? Utf8String::SkipEmptyParts : Utf8String::KeepEmptyParts) {}
    void apply(const TextLine& line, std::string& out) const override {
        for (const Utf8String& piece : replaced(matcher_, line, "\n").split('\n', behaviour_)) {
            append(out, piece);
            out += line.end.empty() ? "\n" : line.end;
        }
    }

private:
    Matcher matcher_;
    Utf8String::SplitBehaviour behaviour_;
};

// In UTF-32, as a set of units of UTF-8 would take characters apart.
class Strip : public TextOperation {
public:
    Strip(const Utf32String& set, Side side) : set_(set.begin(), set.end()), side_(side) {}
    void apply(const TextLine& line, std::string& out) const override {
        Utf32String text(Utf8String{View(line.text)});
        if (side_ != Side::Back) {
            text.strip(set_);
        }
        if (side_ != Side::Front) {
            text.rstrip(set_);
        }
        append(out, Utf8String(text));
        out += line.end;
    }

private:
    kvt::ex::vector<char32_t> set_;
    Side side_;
};

class Hash : public TextOperation {
public:
    Hash(CaseRule rule, Statements form) : rule_(rule), form_(form) {}
    void apply(const TextLine& line, std::string& out) const override {
        const Utf8String text =
            rule_ == CaseRule::Ignore ? mapped(CaseChange::Fold, line.text) : Utf8String(View(line.text));
        const std::uint64_t hash = text.hash();
        std::string digits;
        for (int shift = 60; shift >= 0; shift -= 4) {
            digits += "0123456789abcdef"[hash >> shift & 15];
        }
        if (form_ == Statements::Records) {
            nlohmann::ordered_json record;
            record["file"] = line.file;
            record["line"] = line.number;
            record["hash"] = digits;
            digits = record.dump();
        }
        out.append(digits) += '\n';
    }
    bool givesText() const override { return false; }

private:
    CaseRule rule_;
    Statements form_;
};

} // namespace

std::unique_ptr<TextOperation> changeCase(CaseChange change) {
    return std::make_unique<Case>(change);
}

std::unique_ptr<TextOperation> findText(const std::string& needle, CaseRule rule, Statements form) {
    return std::make_unique<Find>(needleOf(needle, "NEEDLE"), rule, form);
}

std::unique_ptr<TextOperation> replaceText(const std::string& from, const std::string& to, CaseRule rule) {
    return std::make_unique<Replace>(needleOf(from, "FROM"), Utf8String(View(to)), rule);
}

std::unique_ptr<TextOperation> splitText(const std::string& delimiter, CaseRule rule, bool skipEmpty) {
    return std::make_unique<Split>(needleOf(delimiter, "DELIMITER"), rule, skipEmpty);
}

std::unique_ptr<TextOperation> stripText(const std::string& set, Side side) {
    return std::make_unique<Strip>(Utf32String(Utf8String(View(set))), side);
}

std::unique_ptr<TextOperation> hashText(CaseRule rule, Statements form) {
    return std::make_unique<Hash>(rule, form);
}

void appendFolded(std::string_view text, std::string& out) {
    append(out, mapped(CaseChange::Fold, text));
}

} // namespace host
