#include "infer/proposal.h"

#include "base/text.h"
#include "translate/job_text.h"

#include <algorithm>
#include <cstddef>
#include <string_view>
#include <vector>

namespace host {

namespace {

// 1234567 as "1,234,567".
std::string grouped(std::uint64_t number) {
    std::string text = std::to_string(number);
    for (std::size_t at = text.size(); at > 3;) {
        at -= 3;
        text.insert(at, ",");
    }
    return text;
}

std::string counted(std::uint64_t count, const char* one, const char* many) {
    return grouped(count) + " " + (count == 1 ? one : many);
}

std::string list(const std::vector<std::string>& texts) {
    if (texts.size() == 1) {
        return tomlString(texts.front());
    }
    std::string out = "[";
    for (const std::string& text : texts) {
        out += (out.size() > 1 ? ", " : "") + tomlString(text);
    }
    return out + "]";
}

std::string shown(const std::string& text) {
    return "\"" + printable(text) + "\"";
}

class Proposal {
public:
    explicit Proposal(const Survey& survey) : survey_(survey) {}

    std::string text() {
        remark("What " + printable(survey_.file) +
               " seems to be: " + counted(survey_.bytes, "byte", "bytes") + ", " +
               counted(survey_.rows, "row", "rows") + ". Look it over, and then");
        remark("");
        remark("    kvt translate --job THIS FILE");
        writeInput();
        writeOutput();
        for (std::size_t i = 0; i < survey_.columns.size(); ++i) {
            writeColumn(i);
        }
        return out_;
    }

private:
    void remark(const std::string& text) { out_ += text.empty() ? "#\n" : "# " + text + "\n"; }
    void set(const std::string& name, const std::string& value) { out_ += name + " = " + value + "\n"; }

    // ---- The form of the file

    void writeInput() {
        out_ += "\n[input]\n";
        explainEncodings();
        set("encoding", tomlString(survey_.encodings.front().name));
        const TableGuess& table = survey_.table;
        remark(table.columns == 1
                   ? "No delimiter parts the rows: there is one column."
                   : "Of the first " + counted(table.rows, "row", "rows") + ", " +
                         grouped(table.rowsOfWidth) + " have " + grouped(table.columns) + " cells by it.");
        set("delimiter", tomlString(std::string(1, table.form.delimiter)));
        if (table.form.quote != '"') {
            remark("No cell stands in double quotes.");
            set("quote", tomlString(std::string(1, table.form.quote)));
        }
        remark("Because " + survey_.aboutHeader + ".");
        set("header", survey_.hasHeader ? "true" : "false");
        explainRows();
    }

    void explainEncodings() {
        if (survey_.isEncodingGiven) {
            return remark("As you said.");
        }
        const EncodingOpinion& best = survey_.encodings.front();
        if (survey_.isMarked) {
            remark("The file begins with the byte order mark of " + best.name + ".");
        } else if (survey_.isAscii) {
            remark("All bytes are ASCII, which is the same in nearly every encoding.");
        } else if (best.losses == 0) {
            remark("All of it is text in " + best.name + ", with " +
                   counted(best.beyondAscii, "character", "characters") + " beyond ASCII" +
                   (best.confidence > 0
                        ? "; the detector's confidence is " + std::to_string(best.confidence) + " of 100"
                        : "") +
                   ".");
        }
        explainLosses(best);
        for (std::size_t i = 1; i < survey_.encodings.size() && !survey_.isAscii; ++i) {
            explainOther(survey_.encodings[i]);
        }
    }

    void explainLosses(const EncodingOpinion& opinion) {
        if (opinion.losses != 0) {
            remark("Not all of it is text in " + opinion.name + ": " +
                   counted(opinion.losses, "place is", "places are") + " not, the first at byte " +
                   std::to_string(opinion.firstLoss.value_or(0)) + ".");
        }
    }

    void explainOther(const EncodingOpinion& opinion) {
        if (opinion.losses != 0) {
            return explainLosses(opinion);
        }
        std::string about;
        if (opinion.controls != 0) {
            about = ", but " + counted(opinion.controls, "character is a control character then",
                                       "characters are control characters then");
        } else if (opinion.confidence > 0) {
            about = "; the detector's confidence is " + std::to_string(opinion.confidence) + " of 100";
        }
        remark(opinion.name + " can read it, too" + about + ".");
    }

    void explainRows() {
        if (survey_.emptyRows != 0) {
            remark(counted(survey_.emptyRows, "row is", "rows are") + " empty.");
        }
        if (survey_.oddRows != 0) {
            remark(counted(survey_.oddRows, "row has", "rows have") +
                   " more or fewer cells, the first is row " + rowNumber(survey_.firstOddRow) + ".");
        }
        if (survey_.brokenRows != 0) {
            remark(counted(survey_.brokenRows, "row has", "rows have") +
                   " a quote that is not closed rightly or a byte of zero, the first is row " +
                   rowNumber(survey_.firstBrokenRow) + ".");
        }
    }

    // Counted as translate does, the header being row 1.
    std::string rowNumber(std::uint64_t row) const { return std::to_string(row + 1); }

    void writeOutput() {
        out_ += "\n[output]\n";
        set("encoding", tomlString("UTF-8"));
        out_ += "\n[failures]\n";
        remark("What becomes of a cell that a step cannot translate: \"keep\", \"empty\", \"skip\" its row, "
               "or \"stop\".");
        set("on-error", tomlString("keep"));
    }

    // ---- Columns

    void writeColumn(std::size_t index) {
        const SurveyedColumn& column = survey_.columns[index];
        out_ += "\n";
        switch (column.guess.type()) {
        case ColumnGuess::Type::Empty:
            remark(titleOf(index) + ": nothing in it.");
            break;
        case ColumnGuess::Type::Text:
            writeText(index);
            break;
        case ColumnGuess::Type::Date:
            writeDates(index);
            break;
        case ColumnGuess::Type::Number:
            writeNumbers(index);
            break;
        }
        if (column.doubled.cells() != 0) {
            remark("  " + counted(column.doubled.cells(), "cell", "cells") +
                   " went through the wrong encoding once, UTF-8 read as windows-1252: " +
                   shown(column.doubled.example()) + " was " + shown(column.doubled.meant()) + ".");
        }
    }

    std::string titleOf(std::size_t index) const {
        const std::string& name = survey_.columns[index].name;
        return "Column " + std::to_string(index + 1) + (name.empty() ? "" : ", " + shown(name));
    }

    static std::string aboutEmpty(const ColumnGuess& guess) {
        return guess.empty() == 0 ? "" : ", " + counted(guess.empty(), "cell", "cells") + " empty";
    }

    static std::string aboutOthers(const ColumnGuess& guess) {
        return guess.others() == 0 ? ""
                                   : ", " + counted(guess.others(), "other", "others") + " such as " +
                                         shown(guess.exampleOfOthers());
    }

    // Few columns of dates and numbers are clean: what speaks for one is said, too.
    void writeText(std::size_t index) {
        const ColumnGuess& guess = survey_.columns[index].guess;
        const auto some = [](std::uint64_t count, const char* one, const char* many) {
            return count == 0 ? "" : "; " + counted(count, one, many);
        };
        remark(titleOf(index) + ": text" + aboutEmpty(guess) +
               some(guess.dates().cells(), "cell is a date or time", "cells are dates or times") +
               some(guess.numbers().cells(), "cell is a number", "cells are numbers") +
               some(guess.numbers().withLeadingZero(), "of them with a zero in front",
                    "of them with a zero in front") +
               ".");
    }

    void beginStep(const std::string& name, std::size_t index) {
        out_ += "[[step]]\n";
        set("do", tomlString(name));
        set("column", tomlString(columnName(index)));
    }

    // By its name, where that says which it is.
    std::string columnName(std::size_t index) const {
        const std::string& name = survey_.columns[index].name;
        return name.empty() ? std::to_string(index + 1) : name;
    }

    void writeDates(std::size_t index) {
        const ColumnGuess& guess = survey_.columns[index].guess;
        remark(titleOf(index) + ": " + counted(guess.dates().cells(), "date or time", "dates or times") +
               aboutEmpty(guess) + aboutOthers(guess) + ".");
        std::vector<std::string> formats;
        for (const DateForm& form : guess.dates().forms()) {
            formats.push_back(form.format);
            remark("  " + grouped(form.cells) + " as " + form.format + ", such as " + shown(form.example) +
                   (form.alternative.empty() ? "" : "; " + form.alternative + " reads them as well"));
        }
        const std::vector<std::string> months = guess.dates().months();
        if (!months.empty()) {
            remark("  The names of months are those of language '" + months[0] + "'" +
                   (months.size() > 1 ? "; '" + months[1] + "' has the same ones" : "") + ".");
        }
        beginStep("date", index);
        set("format", list(formats));
        if (!months.empty()) {
            set("months", tomlString(months[0]));
        }
        if (std::any_of(formats.begin(), formats.end(),
                        [](const std::string& format) { return format.find("%y") != std::string::npos; })) {
            remark("Years of two digits: those from this one on are of the last century.");
            set("pivot", "50");
        }
        out_ += "[[step]]\n";
        set("do", tomlString("write-date"));
        set("column", tomlString(columnName(index)));
        set("format", tomlString("ISO"));
    }

    void writeNumbers(std::size_t index) {
        const ColumnGuess& guess = survey_.columns[index].guess;
        const NumberGuess& numbers = guess.numbers();
        const NumberStyle style = numbers.style();
        static constexpr std::array<const char*, numberStyles> words = {
            "digits and perhaps a decimal point", "a decimal point and commas between thousands",
            "a decimal comma, perhaps points between thousands",
            "a decimal comma and blanks between thousands",
            "a decimal point and apostrophes between thousands"};
        static constexpr std::array<const char*, numberStyles> languages = {"", "en", "de", "fr", "de-CH"};
        const auto place = static_cast<std::size_t>(style);
        remark(titleOf(index) + ": " + counted(numbers.cells(), "number", "numbers") + aboutEmpty(guess) +
               aboutOthers(guess) + ".");
        const std::string example = numbers.example(style);
        remark("  " + grouped(numbers.cellsOf(style)) + " with " + words[place] +
               (example.empty() ? "" : ", such as " + shown(example)));
        if (style == NumberStyle::Plain) {
            return;
        }
        beginStep("number", index);
        set("language", tomlString(languages[place]));
    }

    const Survey& survey_;
    std::string out_;
};

} // namespace

std::string proposedJob(const Survey& survey) {
    return Proposal(survey).text();
}

} // namespace host
