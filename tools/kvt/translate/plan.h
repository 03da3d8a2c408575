// A job, read: its words as values, and the names of the columns that it is for.
#pragma once

#include "text/byte_order_mark.h"
#include "translate/job.h"
#include "translate/layout.h"
#include "translate/row_cells.h"
#include "translate/row_form.h"
#include "translate/step.h"

#include <kvt/encoding/encoding.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace host {

enum class RowEnds { Keep, Lf, CrLf };

/// The words of a job for RowEnds and OnCellError.
std::vector<std::string> rowEndWords();
std::vector<std::string> onErrorWords();

struct Plan {
    /// Throws Failure for whatever is wrong with the job as such.
    explicit Plan(const Job& job);

    Job job;
    TextEncoding from;
    kvt::ex::Encoding to;
    RowForm in;
    RowForm out;
    RowEnds lineEnds;
    OnCellError onError;
    std::uint64_t mostErrors;
    /// The columns by which rows are sorted, or of which there is to be one only. At most one of the two.
    std::vector<std::string> sortColumns;
    bool isUnique = false;

    /// Of the input; once they are known.
    std::vector<std::string> names;

    bool isOrdered() const { return !sortColumns.empty(); }
    /// The steps at work on a layout, which becomes that of the output. Throws Failure.
    std::vector<std::unique_ptr<Step>> start(Layout& layout) const;
};

} // namespace host
