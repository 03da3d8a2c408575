// What `kvt convert` was asked to do.
#pragma once

#include "base/progress.h"
#include "convert/text_reading.h"
#include "text/byte_order_mark.h"

#include <kvt/encoding/encoding.h>

#include <string>
#include <vector>

namespace host {

enum class OnError {
    Stop,          ///< at the first loss, without a result
    Replace,       ///< put the substitution there and go on
    Report,        ///< the same, and report each loss
    Transliterate, ///< write it in Latin letters where the target has those, else as Replace
};

struct ConvertOptions {
    std::vector<std::string> inputs; ///< never empty
    std::string output;
    std::string report; ///< empty: standard error
    OnError onError = OnError::Stop;
    MarkPolicy mark = MarkPolicy::Keep;
    bool verify = false;
    ReadingRule reading;
    Progress::Show progress = Progress::Show::Never;

    /// Whether text does not go from bytes to bytes as it is.
    bool changesText() const {
        return reading.fallback || reading.normalization != Normalization::None ||
               onError == OnError::Transliterate;
    }
};

} // namespace host
