#include "translate/cell_step.h"
#include "translate/number_reader.h"

namespace host {

namespace {

class NumberStep : public CellStep {
public:
    NumberStep(std::string column, std::string language)
        : CellStep(std::move(column)), language_(std::move(language)), reader_(language_) {}

protected:
    void applyTo(std::string_view text, RowCells& row) override {
        std::string_view number;
        if (reader_.read(text, number)) {
            set(row, number);
        } else {
            fail(row, makeProblem(problem_number::notANumber, {std::string(text), language_}));
        }
    }

private:
    std::string language_;
    NumberReader reader_;
};

} // namespace

std::unique_ptr<Step> makeNumberStep(const StepValues& values) {
    const std::string& language = values.get("language");
    return std::make_unique<NumberStep>(values.get("column"), language.empty() ? "en" : language);
}

} // namespace host
