#include "translate/plan.h"

#include "base/failure.h"
#include "base/text.h"
#include "cli/choices.h"
#include "cli/sizes.h"
#include "text/encoding_catalogue.h"
#include "translate/step_table.h"

#include <limits>

namespace host {

namespace {

const Choices<RowEnds> rowEndChoices = {
    {"keep", RowEnds::Keep}, {"lf", RowEnds::Lf}, {"crlf", RowEnds::CrLf}};
const Choices<OnCellError> errorChoices = {{"stop", OnCellError::Stop},
                                           {"keep", OnCellError::Keep},
                                           {"empty", OnCellError::Empty},
                                           {"skip", OnCellError::Skip}};

RowForm formOf(const std::string& delimiterOption, const std::string& delimiter, const std::string& quote) {
    const RowForm form{asciiCharacter(delimiterOption, delimiter), asciiCharacter("--quote", quote)};
    if (form.delimiter == form.quote) {
        throw Failure(delimiterOption + " and --quote are the same character");
    }
    return form;
}

} // namespace

std::vector<std::string> rowEndWords() {
    return wordsOf(rowEndChoices);
}

std::vector<std::string> onErrorWords() {
    return wordsOf(errorChoices);
}

Plan::Plan(const Job& wanted)
    : job(wanted), from(inputEncoding(job.input.encoding)), to(textEncoding(job.output.encoding)),
      in(formOf("--delimiter", job.input.delimiter, job.input.quote)),
      out(job.output.delimiter.empty() ? in
                                       : formOf("--out-delimiter", job.output.delimiter, job.input.quote)),
      lineEnds(choose("--line-ends", job.output.lineEnds, rowEndChoices)),
      onError(choose("--on-error", job.onError, errorChoices)),
      mostErrors(job.mostErrors.empty() ? std::numeric_limits<std::uint64_t>::max()
                                        : parseNumber("--max-errors", job.mostErrors)) {
    while (!job.steps.empty() && (job.steps.back().name == "sort" || job.steps.back().name == "unique")) {
        if (isOrdered()) {
            throw Failure("only one 'sort' or 'unique' is possible");
        }
        isUnique = job.steps.back().name == "unique";
        makeStep(job.steps.back().name, job.steps.back().arguments);
        sortColumns = StepValues(job.steps.back(), {}).list("columns");
        job.steps.pop_back();
    }
    for (const JobStep& step : job.steps) {
        if (step.name == "sort" || step.name == "unique") {
            throw Failure("'" + step.name + "' comes behind all other steps");
        }
        startStep(step, job.zoneDatabase);
    }
}

std::vector<std::unique_ptr<Step>> Plan::start(Layout& layout) const {
    std::vector<std::unique_ptr<Step>> steps;
    for (const JobStep& step : job.steps) {
        std::unique_ptr<Step> started = startStep(step, job.zoneDatabase);
        started->bind(layout);
        if (steps.empty() || !steps.back()->takeOver(started)) {
            steps.push_back(std::move(started));
        }
    }
    return steps;
}

} // namespace host
