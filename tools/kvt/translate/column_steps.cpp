// The steps that are about columns and rows as such: drop, keep, rename, split, join, where.

#include "translate/step.h"

#include "base/failure.h"
#include "base/text.h"
#include "text/line_pattern.h"

#include <stdexcept>
#include <utility>

namespace host {

namespace {

class DropStep : public Step {
public:
    explicit DropStep(std::vector<std::string> columns) : columns_(std::move(columns)) {}
    void bind(Layout& layout) override {
        for (const std::string& column : columns_) {
            layout.drop(column);
        }
        if (layout.columns().empty()) {
            throw Failure("drop: no column is left");
        }
    }
    bool apply(RowCells&) override { return true; }

private:
    std::vector<std::string> columns_;
};

class KeepStep : public Step {
public:
    explicit KeepStep(std::vector<std::string> columns) : columns_(std::move(columns)) {}
    void bind(Layout& layout) override { layout.keep(columns_); }
    bool apply(RowCells&) override { return true; }

private:
    std::vector<std::string> columns_;
};

class RenameStep : public Step {
public:
    RenameStep(std::string column, std::string name) : column_(std::move(column)), name_(std::move(name)) {}
    void bind(Layout& layout) override { layout.rename(column_, name_); }
    bool apply(RowCells&) override { return true; }

private:
    std::string column_;
    std::string name_;
};

class SplitStep : public Step {
public:
    SplitStep(std::string column, std::string separator, std::vector<std::string> names)
        : column_(std::move(column)), separator_(std::move(separator)), names_(std::move(names)) {}

    void bind(Layout& layout) override {
        const Layout::Column source = layout.at(column_);
        column_ = source.name;
        source_ = source.slot;
        for (const std::string& name : names_) {
            slots_.push_back(layout.add(name, source_));
        }
        layout.dropSlot(source_);
    }

    bool apply(RowCells& row) override {
        for (const std::size_t slot : slots_) {
            row.set(slot, {});
        }
        if (row.hasFailed(source_)) {
            return true;
        }
        const std::string_view text = row.text(source_);
        std::vector<std::string_view>& pieces = pieces_;
        pieces.clear();
        std::size_t begin = 0;
        for (std::size_t end = text.find(separator_); end != std::string_view::npos;
             end = text.find(separator_, begin)) {
            pieces.push_back(text.substr(begin, end - begin));
            begin = end + separator_.size();
        }
        pieces.push_back(text.substr(begin));
        if (pieces.size() > slots_.size()) {
            row.fail(source_, column_,
                     makeProblem(problem_number::pieceCount,
                                 {std::string(text), std::to_string(pieces.size()) + " pieces",
                                  std::to_string(slots_.size())}));
            return true;
        }
        for (std::size_t index = 0; index < pieces.size(); ++index) {
            row.set(slots_[index], pieces[index]);
        }
        return true;
    }

private:
    std::string column_;
    std::string separator_;
    std::vector<std::string> names_;
    std::size_t source_ = 0;
    std::vector<std::size_t> slots_;
    std::vector<std::string_view> pieces_;
};

class JoinStep : public Step {
public:
    JoinStep(std::string name, std::vector<std::string> columns, std::string separator)
        : name_(std::move(name)), columns_(std::move(columns)), separator_(std::move(separator)) {}

    void bind(Layout& layout) override {
        for (const std::string& column : columns_) {
            sources_.push_back(layout.at(column).slot);
        }
        target_ = layout.add(name_, sources_.front());
        for (const std::size_t slot : sources_) {
            layout.dropSlot(slot);
        }
    }

    bool apply(RowCells& row) override {
        joined_.clear();
        for (std::size_t index = 0; index < sources_.size(); ++index) {
            joined_.append(index == 0 ? std::string_view() : std::string_view(separator_))
                .append(row.text(sources_[index]));
        }
        row.set(target_, joined_);
        return true;
    }

private:
    std::string name_;
    std::vector<std::string> columns_;
    std::string separator_;
    std::size_t target_ = 0;
    std::vector<std::size_t> sources_;
    std::string joined_;
};

class WhereStep : public Step {
public:
    WhereStep(std::string column, const std::string& regex, bool isWanted)
        : column_(std::move(column)), pattern_(compileUnicodePattern(regex, LetterCase::Distinguish)),
          isWanted_(isWanted) {}

    void bind(Layout& layout) override {
        const Layout::Column& column = layout.at(column_);
        column_ = column.name;
        slot_ = column.slot;
    }

    bool apply(RowCells& row) override {
        if (row.hasFailed(slot_)) {
            return true;
        }
        const std::string_view text = row.text(slot_);
        try {
            return pattern_->find(text) == isWanted_;
        } catch (const std::runtime_error&) {
            row.fail(slot_, column_, makeProblem(problem_number::regexTakesTooLong, {std::string(text)}));
            return true;
        }
    }

private:
    std::string column_;
    std::unique_ptr<LinePattern> pattern_;
    bool isWanted_;
    std::size_t slot_ = 0;
};

} // namespace

std::unique_ptr<Step> makeDropStep(const StepValues& values) {
    return std::make_unique<DropStep>(values.list("columns"));
}

std::unique_ptr<Step> makeKeepStep(const StepValues& values) {
    return std::make_unique<KeepStep>(values.list("columns"));
}

std::unique_ptr<Step> makeRenameStep(const StepValues& values) {
    return std::make_unique<RenameStep>(values.get("column"), values.get("name"));
}

std::unique_ptr<Step> makeSplitStep(const StepValues& values) {
    return std::make_unique<SplitStep>(values.get("column"), values.get("separator"), values.list("names"));
}

std::unique_ptr<Step> makeJoinStep(const StepValues& values) {
    return std::make_unique<JoinStep>(values.get("name"), values.list("columns"), values.get("separator"));
}

std::unique_ptr<Step> makeWhereStep(const StepValues& values) {
    if (values.has("regex") == values.has("not")) {
        throw Failure("takes one of 'regex' and 'not'");
    }
    return std::make_unique<WhereStep>(
        values.get("column"), values.get(values.has("regex") ? "regex" : "not"), values.has("regex"));
}

} // namespace host
