#include "text/source.h"

#include "base/failure.h"

#include <utility>

namespace host {

void checkMark(MarkPolicy policy, kvt::ex::Encoding from) {
    if ((policy == MarkPolicy::Strip || policy == MarkPolicy::Add) && hasInseparableMark(from)) {
        throw Failure("a byte order mark cannot be cut off " + std::string(from.getName()) +
                      ", where its bytes depend on what follows");
    }
}

Source::Source(const std::string& path, const TextEncoding& from, MarkPolicy policy)
    : input_(path), first_(from.firstBlock(input_)), encoding_(from.of(first_, input_.name())) {
    const std::string_view mark = policy == MarkPolicy::Keep ? std::string_view() : byteOrderMark(encoding_);
    if (!mark.empty() && first_.starts_with(mark)) {
        skipped_ = mark.size();
        first_.remove_prefix(mark.size());
    }
}

std::string_view Source::next() {
    // A block that was all mark would pass for the end of the file.
    const bool isAllMark = first_.empty() && skipped_ != 0;
    return std::exchange(started_, true) || isAllMark ? input_.read() : first_;
}

} // namespace host
