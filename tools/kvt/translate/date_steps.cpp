// The steps that are about dates and times: date, write-date, zone, add.

#include "translate/cell_step.h"

#include "base/failure.h"
#include "date/function.h"
#include "date/outcome.h"
#include "date/zone_setting.h"
#include "translate/date_reader.h"

#include <kvt/datetime/datetime.h>

namespace host {

namespace {

namespace datetime = kvt::ex::datetime;
using kvt::ex::UString;

// What the functions on canonical values share.
class CanonicalStep : public CellStep {
public:
    using CellStep::CellStep;

protected:
    const UString<0>& valueOf(std::string_view text) {
        value_.clear();
        value_.append(kvt::ex::UStringView<0>(text));
        return value_;
    }

    // Nearly all cells are good, and need no outcome that words a failure.
    void take(const datetime::TextResult& result, RowCells& row) {
        const UString<0>& text = std::get<1>(result);
        if (std::get<0>(result) == datetime::ReturnState::Success && !text.isEmpty()) {
            keep(row, {text.rawData(), text.size()});
        } else {
            take(outcomeOf(result), row);
        }
    }

    void take(const DateOutcome& outcome, RowCells& row) {
        if (outcome.isGood()) {
            keep(row, resultText(outcome));
        } else {
            fail(row, {outcome.message ? outcome.message->number : 0, failureSentence(outcome)});
        }
    }

private:
    UString<0> value_;
};

class WriteDateStep : public CanonicalStep {
public:
    WriteDateStep(std::string column, const std::string& format)
        : CanonicalStep(std::move(column)), format_(toUString(format)),
          fixed_(FixedDateForm::toWrite(format)) {
        if (fixed_) {
            written_.emplace(*fixed_);
        }
    }

    const std::optional<FixedDateForm>& fixedForm() const { return fixed_; }

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        const FixedDateForm& form = text.size() == FixedDateForm::canonicalDate().length()
                                        ? FixedDateForm::canonicalDate()
                                        : FixedDateForm::canonicalDateTime();
        if (written_ && written_->take(text, form)) {
            set(row, written_->view());
        } else {
            take(datetime::format(valueOf(text), format_), row);
        }
    }

private:
    UString<0> format_;
    std::optional<FixedDateForm> fixed_;
    std::optional<FixedDateText> written_;
};

// Nearly all texts are in one form of a fixed length, and become at once what they are to be: canonical, or, where the
// next step writes the date, what that makes of it.
class DateStep : public CellStep {
public:
    DateStep(std::string column, DateReader reader)
        : CellStep(std::move(column)), reader_(std::move(reader)), fixed_(reader_.fixedForm()) {
        if (fixed_) {
            atOnce_.emplace(fixed_->canonical());
            isChanging_ = !fixed_->isCanonical();
        }
    }

    bool takeOver(std::unique_ptr<Step>& next) override {
        auto* const writer = dynamic_cast<WriteDateStep*>(next.get());
        if (writer_ || writer == nullptr || writer->slot() != slot()) {
            return false;
        }
        next.release();
        writer_.reset(writer);
        atOnce_.reset();
        if (fixed_ && writer->fixedForm()) {
            atOnce_.emplace(*writer->fixedForm());
        }
        return true;
    }

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        if (atOnce_ && atOnce_->take(text, *fixed_)) {
            if (isChanging_) {
                change(row, atOnce_->view());
            } else {
                set(row, atOnce_->view());
            }
            return;
        }
        Problem problem;
        std::string_view canonical;
        if (reader_.read(text, canonical, problem)) {
            set(row, canonical);
        } else {
            fail(row, std::move(problem));
        }
        if (writer_) {
            writer_->apply(row);
        }
    }

private:
    DateReader reader_;
    std::optional<FixedDateForm> fixed_;
    std::optional<FixedDateText> atOnce_;
    bool isChanging_ = false; ///< a text in the fixed form is another one than the canonical text
    std::unique_ptr<WriteDateStep> writer_;
};

class AddStep : public CanonicalStep {
public:
    AddStep(std::string column, const std::string& interval)
        : CanonicalStep(std::move(column)), interval_(toUString(interval)) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        take(datetime::add(valueOf(text), interval_), row);
    }

private:
    UString<0> interval_;
};

class ZoneStep : public CanonicalStep {
public:
    ZoneStep(std::string column, ZoneSetting setting)
        : CanonicalStep(std::move(column)), setting_(std::move(setting)) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override { take(setting_.apply(valueOf(text)), row); }

private:
    ZoneSetting setting_;
};

} // namespace

std::unique_ptr<Step> makeDateStep(const StepValues& values) {
    return std::make_unique<DateStep>(
        values.get("column"), DateReader(values.get("format"), values.get("pivot"), values.get("months")));
}

std::unique_ptr<Step> makeWriteDateStep(const StepValues& values) {
    if (const std::string wrong = wrongInWrittenFormat(values.get("format")); !wrong.empty()) {
        throw Failure(wrong);
    }
    return std::make_unique<WriteDateStep>(values.get("column"), values.get("format"));
}

std::unique_ptr<Step> makeAddStep(const StepValues& values) {
    const std::string& interval = values.get("interval");
    const DateOutcome outcome = outcomeOf(datetime::intervalNegate(toUString(interval)));
    if (!outcome.isGood()) {
        throw Failure(failureText(outcome));
    }
    return std::make_unique<AddStep>(values.get("column"), interval);
}

std::unique_ptr<Step> makeZoneStep(const StepValues& values) {
    ZoneDatabaseOption database;
    database.choose(values.zoneDatabase());
    const std::string mode = values.get("mode").empty() ? "automatic" : values.get("mode");
    return std::make_unique<ZoneStep>(values.get("column"),
                                      ZoneSetting(values.get("zone"), zoneMode("the mode", mode), database));
}

} // namespace host
