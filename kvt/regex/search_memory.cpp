// The memory in which the engine notes the ways that it has still to try. One block is enough for most searches; the
// thread keeps it for the next one.
#include <kvt/regex/detail/engine.h>

#include <kvt/platform/thread_end.h>

#include <new>
#include <utility>

namespace kvt::ex::detail {
namespace {

struct KeptBlock {
    KeptBlock() = default;
    KeptBlock(const KeptBlock&) = delete;
    KeptBlock& operator=(const KeptBlock&) = delete;
    ~KeptBlock() { ::operator delete(block); }

    void* block = nullptr;
};

} // namespace
} // namespace kvt::ex::detail

namespace boost::BOOST_REGEX_DETAIL_NS {

using kvt::ex::detail::KeptBlock;
using kvt::platform::ofThisThread;

void* get_mem_block() {
    void* const block = std::exchange(ofThisThread<KeptBlock>().block, nullptr);
    return block != nullptr ? block : ::operator new(BOOST_REGEX_BLOCKSIZE);
}

void put_mem_block(void* block) {
    void*& kept =
        ofThisThread<KeptBlock>().block; // made when the block was given, so that nothing fails here
    if (kept == nullptr) {
        kept = block;
    } else {
        ::operator delete(block);
    }
}

} // namespace boost::BOOST_REGEX_DETAIL_NS
