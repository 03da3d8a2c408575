// Data that outgrows the heap, in one file on disk.
//
// The file is a row of segments, each of which is mapped into memory on demand and carries its own heap
// (mapped_region_segment.h). The manager decides where a segment lies and keeps the file long enough:
//
//     kvt::ex::mmap::memory_manager manager("/var/tmp/work", {});          // temporary, segments of 16 MiB
//     kvt::ex::mmap::mapped_region_segment segment = manager.create_segment();
//     segment.load(false);
//     void* bytes = segment.segment_manager()->allocate(1000);
#pragma once

#include <kvt/foundation/export.h>
#include <kvt/foundation/optional.h>
#include <kvt/foundation/pimpl.h>
#include <kvt/foundation/vector.h>
#include <kvt/mmap/mapped_region_segment.h>

#include <mutex>
#include <string>

namespace kvt::ex {

namespace mmap {

class memory_manager_impl;

struct KVT_EXPORT manager_options {
    static const unsigned long long k_default_segment_size = 16777216;

    /// Bytes of a segment that is created without a size of its own, and of the header segment. Rounded up to whole
    /// pages by the manager; 0 stays 0, and a segment of 0 bytes cannot be loaded, the header segment included. The
    /// header never grows: one of 4096 bytes has room for 191 segments, or for four saved vectors of a few words.
    unsigned long long segment_size = k_default_segment_size;
    /// The file outlives the manager and holds a header.
    bool persistent = false;
};

} // namespace mmap

namespace detail {
extern template class KVT_EXPORT PimplShared<mmap::memory_manager_impl, std::mutex>;
}

namespace mmap {

/// A temporary manager empties the file when it starts and deletes it when the last handle goes; its segments have no
/// index and cannot be asked for again. A persistent manager's file outlives the process: it begins with a header
/// segment, which holds a table of the segments after it, so that open_segment() finds them by their index, and a queue
/// of vectors of words, in which a host keeps between runs what it needs to find its data (save() and restore()).
///
/// The file, little-endian, without any mark of its own:
///
///     0                       the header segment, options().segment_size bytes (persistent files only). Its heap holds
///                             the table and the queue
///     where the table says    the other segments, each from what was the end of the file when it was created
///
/// docs/segment_file.md describes it byte by byte, and segment_file.h has the numbers.
///
/// A file is opened again with the segment_size that it was made with, which stands in no place where the library
/// looks. With a larger one it opens as long as the file is that long. With a smaller one it opens, too: what is in the
/// header can be read as far as it is mapped. But the first change that takes memory of the header's heap, be it save()
/// or create_segment(), writes at the end of that heap, which is not mapped: that ends the process by SIGSEGV, or
/// writes over other memory of the process that happens to lie there.
///
/// What is in the file is trusted. One thing is looked at: as long as the header's stretch is zeros all over, the file
/// was made and never used, and the first call that wants the header makes it.
///
/// What a process leaves behind that ends at any moment, by SIGKILL too:
///   - What was written to mapped memory is in the file for the next process, flushed or not: the system keeps it. Only
///     when the machine itself stops is what was not released lost.
///   - Vectors whose save() has returned, and segments whose create_segment() has returned, are there.
///   - A persistent file comes into being with the full length of its header segment, where the file system allows
///     that.
///   - Not covered: an end in the middle of a change of the header, which is inside save(), restore(),
///     create_segment(), or the first access to a new file, and in the middle of any allocation in a segment for that
///     segment. There is no journal. The heap may then be damaged without anyone noticing, and using it may crash or
///     never end. What was saved and must not be lost has to have its copy elsewhere during such a call.
///   - Not covered: a disk that gets full while the header is changed. As with any mapped memory, the system answers
///     with SIGBUS, which ends the process in the middle of the change.
///   - A segment for which the file grew, but whose row did not get into the table, stays in the file and belongs to
///     nobody.
///   - A segment that was created and never loaded has a row and no heap. open_segment() believes that there is one,
///     and what uses that may crash, never end, or be given memory outside of the segment. So whoever creates a segment
///     loads it before it passes its index on.
///
/// Threads: handles may be copied and dropped on any thread, and all members may be called on all threads; each takes
/// the one mutex of its manager. Segments and their contents are the host's to serialise, and so are two managers that
/// were made for one file: they share its header, and no mutex. One process at a time uses a file; nothing locks it,
/// and a file that another program cuts short ends this one with SIGBUS.
///
/// Signals: where the length of files is limited (RLIMIT_FSIZE), the system answers growth beyond the limit with
/// SIGXFSZ, which ends the process. A host that wants the stated failures instead ignores that signal; the library
/// leaves signals as they are.
///
/// A member throws std::system_error when the mutex cannot be locked.
///
/// A counted handle: copies share one file. A moved-from handle may only be destroyed or assigned to, and the last
/// handle of a file must not be assigned to itself. When the last one goes, a temporary file is deleted; segments that
/// are loaded stay as they are, others must not be loaded any more.
class KVT_EXPORT memory_manager : public detail::PimplShared<memory_manager_impl, std::mutex> {
public:
    /// Opens or makes the file at `path`; one that is made can be read and written by its owner only.
    ///
    /// Throws boost::interprocess::interprocess_exception when the file cannot be opened, with the system's error, and
    /// when a persistent file is shorter than the header segment, with the code size_error. A new persistent file
    /// for which the disk has no room is noticed at the first use of the header, which throws the same.
    memory_manager(const std::string& path, const manager_options& options);

    /// As given, but with segment_size rounded up to whole pages.
    const manager_options& options() const;
    bool persistent() const;

    /// Appends a copy of `words` to the queue in the file; does nothing on a temporary manager.
    ///
    /// Throws boost::interprocess::bad_alloc, whose text is "boost::interprocess::bad_alloc", when the header's heap is
    /// full, which never grows: the queue may then have got a last vector with only some of the words, or none.
    void save(const ex::vector<unsigned long long>& words);

    /// Takes the oldest vector out of the queue and gives it; an empty one when there is none, and on a temporary
    /// manager. Each vector comes out once, in whatever run; an empty result may also be an empty vector saved.
    ex::vector<unsigned long long> restore();

    /// The segment with an index: on a persistent manager the one that the table has, loaded. On a temporary manager,
    /// and for k_no_index, a new segment as by create_segment().
    ///
    /// `index` is that of a segment that has been loaded since it was created (see above). Throws std::out_of_range
    /// "memory_manager: segment index out of range" when the table is shorter, and as mapped_region_segment::load()
    /// does.
    mapped_region_segment open_segment(unsigned long long index) { return load_segment(index, {}); }

    /// A new segment at the end of the file, of `size` bytes rounded up to whole pages, by default
    /// options().segment_size. It is not mapped; load(false) maps it and makes its heap. On a persistent manager it
    /// gets the next index, from 0. The file gets longer, but takes no room on the disk until memory is written to.
    ///
    /// When the file cannot be made longer, the segment has the offset -1, and so has its row in the table: loading it
    /// throws. Loading also throws when the file's length was not a multiple of the page size, since somebody else has
    /// written to it: this segment lies at a crooked offset, and so do all after it. Throws
    /// boost::interprocess::bad_alloc when the header has no room for the row; the file has then grown for nothing.
    mapped_region_segment create_segment(future::optional<unsigned long long> size = {}) {
        return load_segment(k_no_index, size);
    }

private:
    mapped_region_segment load_segment(unsigned long long index, future::optional<unsigned long long> size);
};

} // namespace mmap

} // namespace kvt::ex
