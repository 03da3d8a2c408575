// One step of a translation at work: it looks its columns up once and then goes over row after row. Each thread has steps
// of its own, so that they may keep what they need between rows.
//
// A new step is a class in one of this folder's *_steps.cpp, and one row in step_table.cpp.
#pragma once

#include "translate/job.h"
#include "translate/layout.h"
#include "translate/row_cells.h"

#include <memory>
#include <string>
#include <vector>

namespace host {

class Step {
public:
    virtual ~Step() = default;
    /// Looks up the columns and says what happens to the layout. Once, before all rows. Throws Failure.
    virtual void bind(Layout& layout) = 0;
    /// Does its work on a row; false where the row is not wanted.
    virtual bool apply(RowCells& row) = 0;
    /// Does the work of the step behind it from now on, too, if that saves something; both are bound. False where `next`
    /// stays a step of its own.
    virtual bool takeOver(std::unique_ptr<Step>& next) {
        static_cast<void>(next);
        return false;
    }
};

/// The arguments of a step, looked up by name.
class StepValues {
public:
    StepValues(const JobStep& step, std::string zoneDatabase)
        : arguments_(step.arguments), zoneDatabase_(std::move(zoneDatabase)) {}

    bool has(const std::string& name) const { return find(name) != nullptr; }
    /// Empty where there is none.
    const std::string& get(const std::string& name) const;
    /// A list with commas.
    std::vector<std::string> list(const std::string& name) const;
    /// The folder of the zone database that was chosen, if any.
    const std::string& zoneDatabase() const { return zoneDatabase_; }

private:
    const std::string* find(const std::string& name) const;

    const StepArguments& arguments_;
    std::string zoneDatabase_;
};

using MakeStep = std::unique_ptr<Step> (*)(const StepValues&);

// By what they are about. All throw Failure for arguments that cannot be used.
std::unique_ptr<Step> makeDateStep(const StepValues& values);
std::unique_ptr<Step> makeWriteDateStep(const StepValues& values);
std::unique_ptr<Step> makeZoneStep(const StepValues& values);
std::unique_ptr<Step> makeAddStep(const StepValues& values);
std::unique_ptr<Step> makeNumberStep(const StepValues& values);
std::unique_ptr<Step> makeReplaceStep(const StepValues& values);
std::unique_ptr<Step> makeCaseStep(const StepValues& values);
std::unique_ptr<Step> makeStripStep(const StepValues& values);
std::unique_ptr<Step> makeNormalizeStep(const StepValues& values);
std::unique_ptr<Step> makeDropStep(const StepValues& values);
std::unique_ptr<Step> makeKeepStep(const StepValues& values);
std::unique_ptr<Step> makeRenameStep(const StepValues& values);
std::unique_ptr<Step> makeSplitStep(const StepValues& values);
std::unique_ptr<Step> makeJoinStep(const StepValues& values);
std::unique_ptr<Step> makeWhereStep(const StepValues& values);

} // namespace host
