#include "infer/survey.h"

#include "base/failure.h"
#include "infer/twice_read.h"
#include "text/encoding_catalogue.h"
#include "text/source.h"
#include "translate/cell_text.h"
#include "translate/row_borders.h"
#include "translate/row_reader.h"

#include <algorithm>
#include <optional>
#include <set>
#include <utility>

namespace host {

namespace {

using OnBytes = std::function<void(std::uint64_t)>;

// So much of the beginning says what delimiter there is, and what ICU's detector thinks.
constexpr std::size_t beginningSize = 1024 * 1024;
// A row that is longer than that is not one of a table; mostly a quote was never closed.
constexpr std::size_t longestRow = 64 * 1024 * 1024;
// Each column costs memory for what is known of it.
constexpr std::size_t mostColumns = 1'000'000;

void refuseLongRow(const std::string& file, const RowBorders& borders) {
    if (borders.size() - borders.border() <= longestRow) {
        return;
    }
    const std::string problem = file + ": a row is longer than " + std::to_string(longestRow >> 20) + " MiB";
    throw Failure(borders.isWithinQuotes()
                      ? problem + "; the quote that opens at byte " + std::to_string(borders.openQuote()) +
                            " of its text may never be closed"
                      : problem);
}

// Looks for rows without an end while the encoding is not certain yet, so that not all of a file is read that will be
// refused. Where encoding or form turn out to be others, it may see no such row; the second reading does.
class RowWatch {
public:
    RowWatch(std::string file, kvt::ex::Encoding encoding, std::string_view beginning)
        : file_(std::move(file)), decoder_(encoding, kvt::ex::Encoding::Utf8) {
        decoder_.convert(beginning, text_, {});
        borders_.emplace(guessTable(text_, false).form);
        borders_->add(text_);
    }

    // Throws Failure.
    void add(std::string_view bytes) {
        text_.clear();
        decoder_.convert(bytes, text_, {});
        borders_->add(text_);
        refuseLongRow(file_, *borders_);
    }

private:
    std::string file_;
    kvt::ex::StreamTranscoder decoder_;
    std::string text_;
    std::optional<RowBorders> borders_;
};

// `given` is the encoding where the user has named it.
void guessEncoding(Survey& survey, TwiceRead& file, const std::optional<kvt::ex::Encoding>& given,
                   const OnBytes& onBytes) {
    std::string beginning;
    std::string_view block = file.next();
    for (; !block.empty() && beginning.size() < beginningSize; block = file.next()) {
        beginning += block;
    }
    EncodingGuess guess(beginning);
    guess.add(beginning);
    survey.bytes = beginning.size();
    onBytes(beginning.size());
    if (!block.empty()) {
        RowWatch watch(file.name(), given.value_or(guess.likeliest().encoding), beginning);
        for (; !block.empty(); block = file.next()) {
            watch.add(block);
            guess.add(block);
            survey.bytes += block.size();
            onBytes(block.size());
        }
    }
    survey.encodings = guess.finish();
    survey.isMarked = guess.isMarked();
    survey.isAscii = guess.isAscii();
}

// The text of the file in whole rows, in pieces.
class DecodedRows {
public:
    DecodedRows(Survey& survey, const TwiceRead& file, const OnBytes& onBytes)
        : survey_(survey), onBytes_(onBytes),
          source_(file.path(), survey.encodings.front().encoding, MarkPolicy::Skip),
          decoder_(source_.encoding(), kvt::ex::Encoding::Utf8) {}

    // Calls use(text) for each piece, the last one of which may end without a line end.
    template <typename Use>
    void forEach(const Use& use) {
        while (decode() && text_.size() < beginningSize) {
        }
        survey_.table = guessTable(text_, isEnd_);
        RowBorders borders(survey_.table.form);
        borders.add(text_);
        std::uint64_t taken = 0;
        while (true) {
            const auto whole = static_cast<std::size_t>((isEnd_ ? borders.size() : borders.border()) - taken);
            use(std::string_view(text_).substr(0, whole));
            taken += whole;
            text_.erase(0, whole);
            if (isEnd_) {
                return;
            }
            refuseLongRow(survey_.file, borders);
            const std::size_t old = text_.size();
            decode();
            borders.add(std::string_view(text_).substr(old));
        }
    }

private:
    bool decode() {
        const std::string_view block = source_.next();
        onBytes_(block.size());
        isEnd_ = block.empty();
        if (isEnd_) {
            decoder_.finish(text_, {});
        } else {
            decoder_.convert({block.data(), block.size()}, text_, {});
        }
        return !isEnd_;
    }

    Survey& survey_;
    const OnBytes& onBytes_;
    Source source_;
    kvt::ex::StreamTranscoder decoder_;
    std::string text_;
    bool isEnd_ = false;
};

void takeRow(Survey& survey, const RowReader& reader, std::string& scratch) {
    ++survey.rows;
    if (reader.fault() != RowFault::None) {
        survey.firstBrokenRow = ++survey.brokenRows == 1 ? survey.rows : survey.firstBrokenRow;
        return;
    }
    if (reader.row().empty() && survey.columns.size() > 1) {
        ++survey.emptyRows;
        return;
    }
    if (reader.cellCount() != survey.columns.size()) {
        survey.firstOddRow = ++survey.oddRows == 1 ? survey.rows : survey.firstOddRow;
    }
    const std::size_t count = std::min(reader.cellCount(), survey.columns.size());
    for (std::size_t i = 0; i < count; ++i) {
        const std::string_view text = textOfCell(reader.cell(i), survey.table.form, scratch);
        survey.columns[i].guess.add(text);
        survey.columns[i].doubled.add(text);
    }
}

bool isData(const std::string& cell) {
    ColumnGuess guess;
    guess.add(cell);
    return guess.type() == ColumnGuess::Type::Date || guess.type() == ColumnGuess::Type::Number;
}

// The first row has the names of columns if they are different, none is empty and none is a date or a number.
void judgeHeader(Survey& survey, const std::vector<std::string>& first) {
    if (first.empty()) {
        survey.aboutHeader = "there is no row";
        return;
    }
    std::set<std::string_view> names;
    for (const std::string& cell : first) {
        if (cell.empty() || !names.insert(cell).second || isData(cell)) {
            survey.aboutHeader = cell.empty()   ? "a cell of row 1 is empty"
                                 : isData(cell) ? "row 1 has a date or a number"
                                                : "two cells of row 1 are alike";
            return;
        }
    }
    survey.hasHeader = true;
    const bool isSure =
        std::any_of(survey.columns.begin(), survey.columns.end(), [](const SurveyedColumn& column) {
            const ColumnGuess::Type type = column.guess.type();
            return type == ColumnGuess::Type::Date || type == ColumnGuess::Type::Number;
        });
    survey.aboutHeader = isSure ? "row 1 has names where the rows below have dates or numbers"
                                : "the cells of row 1 are different names; nothing else speaks for it";
}

void surveyRows(Survey& survey, const TwiceRead& file, const OnBytes& onBytes) {
    std::vector<std::string> first;
    std::string scratch;
    bool isFirst = true;
    bool isFirstBroken = false;
    DecodedRows(survey, file, onBytes).forEach([&](std::string_view text) {
        RowReader reader(survey.table.form, text);
        while (reader.next()) {
            if (!std::exchange(isFirst, false)) {
                takeRow(survey, reader, scratch);
                continue;
            }
            if (reader.cellCount() > mostColumns) {
                throw Failure(survey.file + ": row 1 has " + std::to_string(reader.cellCount()) +
                              " cells; no more than " + std::to_string(mostColumns) +
                              " columns are looked at");
            }
            isFirstBroken = reader.fault() != RowFault::None;
            survey.brokenRows += isFirstBroken ? 1 : 0;
            for (std::size_t i = 0; i < reader.cellCount(); ++i) {
                first.emplace_back(textOfCell(reader.cell(i), survey.table.form, scratch));
            }
            survey.columns.resize(std::max(survey.table.columns, first.size()));
        }
    });
    judgeHeader(survey, first);
    for (std::size_t i = 0; i < first.size(); ++i) {
        if (isFirstBroken) {
            continue; // what its cells say is not certain, not even that it is text
        }
        if (survey.hasHeader) {
            survey.columns[i].name = first[i];
        } else {
            survey.columns[i].guess.add(first[i]);
            survey.columns[i].doubled.add(first[i]);
        }
    }
    survey.rows += !survey.hasHeader && !first.empty() ? 1 : 0;
}

} // namespace

Survey surveyFile(const std::string& path, const std::string& encoding, const OnBytes& onBytes) {
    TwiceRead file(path);
    Survey survey;
    survey.file = file.name();
    std::optional<EncodingOpinion> given;
    if (!encoding.empty()) {
        given.emplace(textEncoding(encoding), encoding);
    }
    guessEncoding(survey, file, given ? std::optional(given->encoding) : std::nullopt, onBytes);
    if (given) {
        survey.isEncodingGiven = true;
        survey.encodings.insert(survey.encodings.begin(), *given);
    }
    surveyRows(survey, file, onBytes);
    return survey;
}

} // namespace host
