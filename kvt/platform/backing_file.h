// A file that grows by long stretches which nothing has been written to, and is mapped into memory elsewhere.
//
// Paths are as the system takes them; an open file is a descriptor that the caller owns. Nothing here throws.
#pragma once

#include <cstdint>

namespace kvt::platform {

/// Makes an empty file that its owner alone may read and write, or empties the one that is there. False when neither
/// can be done.
bool makeEmptyFile(const char* path) noexcept;

/// Makes a file of `bytes` zero bytes, as above, where there is none. It comes into being with its whole length, so
/// that a process that ends on the way leaves nothing behind. False, with nothing made, when `bytes` is 0, when
/// there is something at `path`, or when the system or the disk does not allow it.
bool makeFileAtOnce(const char* path, std::uint64_t bytes) noexcept;

/// Makes the file longer by `bytes` zero bytes, of which only the last one is written. Gives the length that the file
/// had, or -1, with the file as it was, when it cannot be made longer.
std::int64_t growFile(const char* path, std::uint64_t bytes) noexcept;

/// The length of an open file, -1 when the system does not report it.
std::int64_t fileSize(int file) noexcept;

/// Writes one zero byte into an open file, so that the page around it has room on the disk and is in memory. Gives 0,
/// or the system's error number. A first touch of mapped memory could not report a full disk, and would read in a long
/// stretch of nothing around it.
int writeZero(int file, std::int64_t offset) noexcept;

/// Whether a stretch within an open file holds nothing but zeros. Parts never written are not read.
bool holdsZerosOnly(int file, std::int64_t offset, std::uint64_t bytes) noexcept;

/// Keeps an open file from programs that this process turns into.
void closeOnExec(int file) noexcept;

} // namespace kvt::platform
