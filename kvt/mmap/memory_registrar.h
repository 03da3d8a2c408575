// Objects that can give their memory back, and the place where a host would register them.
//
// The registrar is inert: it keeps nothing and frees nothing, so that hosts may go on calling it. Memory is given
// back by whoever holds an object and calls release_memory() on it. FileManager is there for its constants.
#pragma once

#include <kvt/foundation/export.h>

namespace kvt::ex {

namespace mmap {

/// What can give its memory back.
class KVT_EXPORT object_mgr {
public:
    object_mgr() = default;
    object_mgr(const object_mgr&) = default;
    object_mgr& operator=(const object_mgr&) = default;
    virtual ~object_mgr();
    /// Gives the object's memory back and says how many bytes that were, 0 when there was nothing to give.
    virtual unsigned long long release_memory() = 0;
};

} // namespace mmap

/// Keeps nothing and frees nothing; any pointer may be handed to it, a null one included.
class KVT_EXPORT MemoryRegistrar {
public:
    MemoryRegistrar() = default;
    MemoryRegistrar(const MemoryRegistrar&) = default;
    MemoryRegistrar(MemoryRegistrar&&) = default;
    ~MemoryRegistrar() = default;
    /// Assignment has nothing to assign; both forms return the object.
    MemoryRegistrar& operator=(const MemoryRegistrar&) noexcept;
    MemoryRegistrar& operator=(MemoryRegistrar&&) noexcept;

    /// Does nothing; no reference to `manager` is kept.
    static void registerManager(mmap::object_mgr* manager);
    /// Does nothing.
    static void deregisterManager(mmap::object_mgr* manager);
    /// Frees nothing, whatever is asked for: 0.
    static unsigned long long freeMemory(unsigned long long bytes);
};

/// Constants of backing files. No code of the library reads them.
class KVT_EXPORT FileManager {
public:
    /// No position.
    static const long long npos = -1;
    /// Bytes to which a stretch of a file is aligned.
    static const unsigned long long alignment = 16;

private:
    static const long long growth_size = 16777216;
    // The largest multiple of growth_size below 2 to the 63rd.
    static const long long max_file_size = 0x7FFFFFFFFF000000;
};

} // namespace kvt::ex
