#include "text/source.h"

#include "base/failure.h"

namespace host {

void checkMark(MarkPolicy policy, kvt::ex::Encoding from) {
    if (policy != MarkPolicy::Keep && hasInseparableMark(from)) {
        throw Failure("a byte order mark cannot be cut off " + std::string(from.getName()) +
                      ", where its bytes depend on what follows");
    }
}

Source::Source(const std::string& path, kvt::ex::Encoding from, MarkPolicy policy)
    : input_(path), mark_(policy == MarkPolicy::Keep ? std::string_view() : byteOrderMark(from)) {}

std::string_view Source::next() {
    if (started_ || mark_.empty()) {
        return input_.read();
    }
    started_ = true;
    std::string_view block = input_.readAtLeast(longestMark);
    if (block.substr(0, mark_.size()) == mark_) {
        skipped_ = mark_.size();
        block.remove_prefix(mark_.size());
    }
    // An empty block would pass for the end of the file.
    return block.empty() ? input_.read() : block;
}

} // namespace host
