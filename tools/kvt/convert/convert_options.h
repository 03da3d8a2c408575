// What `kvt convert` was asked to do.
#pragma once

#include "base/progress.h"
#include "text/byte_order_mark.h"

#include <kvt/encoding/encoding.h>

#include <string>
#include <vector>

namespace host {

enum class OnError {
    Stop,    ///< at the first loss, without a result
    Replace, ///< put the substitution there and go on
    Report,  ///< the same, and report each loss
};

struct ConvertOptions {
    std::vector<std::string> inputs; ///< never empty
    std::string output;
    std::string report; ///< empty: standard error
    OnError onError = OnError::Stop;
    MarkPolicy mark = MarkPolicy::Keep;
    bool verify = false;
    Progress::Show progress = Progress::Show::Never;
};

} // namespace host
