#include "text/match_print.h"

#include "base/failure.h"
#include "base/text.h"
#include "base/text_units.h"

#include <nlohmann/json.hpp>

#include <algorithm>
#include <charconv>
#include <optional>
#include <utility>

namespace host {

namespace {

std::string_view textOf(const TextLine& line, const std::optional<GroupPlace>& place) {
    return place ? line.text.substr(place->position, place->length) : std::string_view();
}

std::size_t characterCount(std::string_view text) {
    return text.size() - static_cast<std::size_t>(std::count_if(text.begin(), text.end(), isContinuation));
}

std::string_view endOf(const TextLine& line) {
    return line.end.empty() ? std::string_view("\n") : line.end;
}

// All that labels what it prints.
class Labelled : public MatchPrinter {
public:
    explicit Labelled(const MatchLabels& labels) : labels_(labels) {}

protected:
    void label(const TextLine& line, char separator, std::string& out) const {
        if (labels_.file) {
            out.append(line.file) += separator;
        }
        if (labels_.line) {
            out.append(std::to_string(line.number)) += separator;
        }
    }

private:
    MatchLabels labels_;
};

class Lines : public Labelled {
public:
    using Labelled::Labelled;
    bool needsPlaces() const override { return false; }
    void begin(const TextLine& line, std::string& out) override {
        label(line, ':', out);
        out.append(line.text).append(endOf(line));
    }
};

class Replaced : public Labelled {
public:
    Replaced(const MatchLabels& labels, Replacement text) : Labelled(labels), text_(std::move(text)) {}
    void begin(const TextLine& line, std::string& out) override {
        label(line, ':', out);
        done_ = 0;
    }
    bool take(const TextLine& line, const GroupPlaces& groups, std::string& out) override {
        out.append(line.text.substr(done_, groups[0]->position - done_));
        text_.append(line.text, groups, out);
        done_ = groups[0]->position + groups[0]->length;
        return true;
    }
    void end(const TextLine& line, std::string& out) override {
        out.append(line.text.substr(done_)).append(endOf(line));
    }

private:
    Replacement text_;
    std::size_t done_ = 0;
};

class Matches : public Labelled {
public:
    explicit Matches(const MatchLabels& labels, std::optional<Replacement> text = std::nullopt)
        : Labelled(labels), text_(std::move(text)) {}
    void begin(const TextLine&, std::string&) override {}
    bool take(const TextLine& line, const GroupPlaces& groups, std::string& out) override {
        if (!text_ && groups[0]->length == 0) {
            return true;
        }
        label(line, ':', out);
        if (text_) {
            text_->append(line.text, groups, out);
        } else {
            out.append(textOf(line, groups[0]));
        }
        out.append(endOf(line));
        return true;
    }

private:
    std::optional<Replacement> text_;
};

void appendCell(std::string_view text, std::string& out) {
    for (const char byte : text) {
        if (byte == '\t' || byte == '\\') {
            out.append(byte == '\t' ? "\\t" : "\\\\");
        } else {
            out += byte;
        }
    }
}

class Rows : public Labelled {
public:
    using Labelled::Labelled;
    void begin(const TextLine&, std::string&) override {}
    bool take(const TextLine& line, const GroupPlaces& groups, std::string& out) override {
        label(line, '\t', out);
        const std::size_t first = groups.size() == 1 ? 0 : 1;
        for (std::size_t number = first; number < groups.size(); ++number) {
            out.append(number == first ? "" : "\t");
            appendCell(textOf(line, groups[number]), out);
        }
        out.append(endOf(line));
        return true;
    }
};

class Groups : public Labelled {
public:
    explicit Groups(bool showFile) : Labelled({showFile, true}), showFile_(showFile) {}
    bool givesText() const override { return false; }
    bool asksForPlaces() const override { return true; }
    void begin(const TextLine&, std::string&) override {}
    bool take(const TextLine& line, const GroupPlaces& groups, std::string& out) override {
        for (std::size_t number = 0; number < groups.size(); ++number) {
            const std::string_view text = textOf(line, groups[number]);
            if (groups[number]) {
                appendPlace(line.placeOf(groups[number]->position), showFile_, out);
                out.append(":" + std::to_string(number) + ":" + std::to_string(characterCount(text)) + ":");
                out.append(text);
            } else {
                label(line, ':', out);
                out.append("-:-:" + std::to_string(number) + ":-:");
            }
            out += '\n';
        }
        return false;
    }

private:
    bool showFile_;
};

class Records : public Labelled {
public:
    using Labelled::Labelled;
    bool givesText() const override { return false; }
    bool asksForPlaces() const override { return true; }
    void begin(const TextLine&, std::string&) override {}
    bool take(const TextLine& line, const GroupPlaces& groups, std::string& out) override {
        nlohmann::ordered_json record;
        record["file"] = line.file;
        record["line"] = line.number;
        addPlace(line, *groups[0], record);
        record["groups"] = nlohmann::ordered_json::array();
        for (std::size_t number = 1; number < groups.size(); ++number) {
            nlohmann::ordered_json group;
            if (groups[number]) {
                addPlace(line, *groups[number], group);
            }
            record["groups"].push_back(std::move(group));
        }
        out.append(record.dump()) += '\n';
        return true;
    }

private:
    static void addPlace(const TextLine& line, const GroupPlace& group, nlohmann::ordered_json& object) {
        const Place place = line.placeOf(group.position);
        object["column"] = place.column;
        object["offset"] = place.offset;
        object["length"] = characterCount(textOf(line, group));
        object["text"] = textOf(line, group);
    }
};

} // namespace

std::unique_ptr<MatchPrinter> printLines(const MatchLabels& labels) {
    return std::make_unique<Lines>(labels);
}

std::unique_ptr<MatchPrinter> printReplaced(const MatchLabels& labels, Replacement text) {
    return std::make_unique<Replaced>(labels, std::move(text));
}

std::unique_ptr<MatchPrinter> printMatches(const MatchLabels& labels) {
    return std::make_unique<Matches>(labels);
}

std::unique_ptr<MatchPrinter> printReplacements(const MatchLabels& labels, Replacement text) {
    return std::make_unique<Matches>(labels, std::move(text));
}

std::unique_ptr<MatchPrinter> printRows(const MatchLabels& labels) {
    return std::make_unique<Rows>(labels);
}

std::unique_ptr<MatchPrinter> printGroups(bool showFile) {
    return std::make_unique<Groups>(showFile);
}

std::unique_ptr<MatchPrinter> printRecords(const MatchLabels& labels) {
    return std::make_unique<Records>(labels);
}

Replacement::Replacement(std::string_view typed, std::size_t groupCount) {
    std::string text;
    for (std::size_t at = 0; at < typed.size();) {
        if (typed[at] != '$') {
            text += typed[at++];
            continue;
        }
        const std::string_view behind = typed.substr(at + 1);
        if (behind.starts_with('$')) {
            text += '$';
            at += 2;
            continue;
        }
        const bool isBraced = behind.starts_with('{');
        const char* const digits = behind.data() + (isBraced ? 1 : 0);
        std::size_t group = 0;
        const auto [stop, error] = std::from_chars(digits, typed.data() + typed.size(), group);
        const bool isClosed = !isBraced || (stop != typed.data() + typed.size() && *stop == '}');
        if (stop == digits || !isClosed) {
            throw Failure(
                "--replace takes $0, $1 and so on for groups, ${1} before a digit, and $$ for a dollar, "
                "not '" +
                printable(typed.substr(at)) + "'");
        }
        const std::string_view name = typed.substr(at, static_cast<std::size_t>(stop - typed.data()) - at);
        if (error != std::errc() || group > groupCount) {
            throw Failure("--replace names '" + std::string(name) + (isBraced ? "}" : "") +
                          "', and REGEX has " +
                          (groupCount == 0 ? "no groups" : counted(groupCount, "group", "groups")));
        }
        pieces_.push_back({std::exchange(text, {}), group});
        at = static_cast<std::size_t>(stop - typed.data()) + (isBraced ? 1 : 0);
    }
    pieces_.push_back({std::move(text), none});
}

void Replacement::append(std::string_view line, const GroupPlaces& groups, std::string& out) const {
    for (const Piece& piece : pieces_) {
        out.append(piece.text);
        if (piece.group != none && groups[piece.group]) {
            out.append(line.substr(groups[piece.group]->position, groups[piece.group]->length));
        }
    }
}

} // namespace host
