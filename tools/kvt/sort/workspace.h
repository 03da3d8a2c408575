// Room on disk for what does not fit memory: the segments of a temporary memory_manager.
//
// The file is made for this, named to the signal handler, and gone when the Workspace goes. A Stretch is a
// segment with one allocation in its heap: bytes that are written once, read once, taken out of memory when they
// have been (letGo), and given back to the disk with the Stretch. Nothing is ever flushed: no content outlives
// the command.
//
// A Workspace outlives its Stretches. Both are used by one thread.
#pragma once

#include "base/interrupt.h"

#include <kvt/mmap/memory_manager.h>

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <string_view>

namespace host {

class Stretch;

class Workspace {
public:
    /// `path` names a file that does not exist yet and is made at once; without one, a file in the folder of
    /// temporary files is made when it is first needed. Throws Failure.
    explicit Workspace(std::string path);
    Workspace(const Workspace&) = delete;
    Workspace& operator=(const Workspace&) = delete;
    ~Workspace();

    /// Room for so many bytes, of which the disk has set aside none so far. Throws Failure.
    std::unique_ptr<Stretch> allocate(std::uint64_t bytes);

    /// Takes the pages of `bytes` out of this process's memory; they stay what they are and come back when they
    /// are looked at. Bytes that are not of this workspace are left alone.
    void letGo(std::string_view bytes) const;

private:
    friend class Stretch;

    void open();
    void createFile();
    void remove();

    std::string path_;
    int descriptor_ = -1;
    std::unique_ptr<RemovedOnInterrupt> guard_;
    std::optional<kvt::ex::mmap::memory_manager> manager_;
    std::map<const char*, std::uint64_t> stretches_; ///< address and size of each
};

class Stretch {
public:
    Stretch(const Stretch&) = delete;
    Stretch& operator=(const Stretch&) = delete;
    /// Gives the disk back.
    ~Stretch();

    char* data() { return data_; }
    const char* data() const { return data_; }
    std::uint64_t size() const { return size_; }

    /// Sees to it that the disk has room for the first `bytes`; without it, a write that finds the disk full ends
    /// the program. Throws Failure.
    void reserve(std::uint64_t bytes);

private:
    friend class Workspace;

    Stretch(Workspace& owner, std::uint64_t size);

    Workspace& owner_;
    kvt::ex::mmap::mapped_region_segment segment_;
    char* data_ = nullptr;
    std::uint64_t size_;
    std::uint64_t reserved_ = 0;
};

/// Calls use(piece) for the whole of `bytes` in order, in pieces that are let go of one after the other, so that a
/// text of any length passes through little memory.
template <typename Use>
void forEachPiece(const Workspace& workspace, std::string_view bytes, const Use& use) {
    constexpr std::size_t pieceSize = 1024 * 1024;
    while (bytes.size() > pieceSize) {
        use(bytes.substr(0, pieceSize));
        workspace.letGo(bytes.substr(0, pieceSize));
        bytes.remove_prefix(pieceSize);
    }
    use(bytes);
}

} // namespace host
