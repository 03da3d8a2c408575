// The form of a memory_manager's file in numbers, for a program that reads one without mapping it.
//
// A file is a row of segments. A segment that is in use begins with a heap; the first segment of a persistent file, the
// header segment, holds one object in its heap, with the table of the other segments and the queue of saved vectors.
// docs/segment_file.md of the source tree describes the whole form byte by byte.
//
// All numbers are frozen: files of older versions of this library have them. A name that ends in "At" is a position
// within the structure that it belongs to. All are bytes, where nothing else is said, and words have 8 of them, the
// lowest first. A pointer is the distance from its own position to what it points to.
#pragma once

#include <cstdint>

namespace kvt::ex::mmap::segment_file {

/// The pointer that points nowhere.
inline constexpr std::uint64_t nullPointer = 1;

// ---- A tree: the count of its nodes, and a node whose parent is the root of the tree

inline constexpr std::uint64_t treeSize = 32;
inline constexpr std::uint64_t treeRootAt = 8;
/// A node: pointers to its parent, to what is left of it, and to what is right of it.
inline constexpr std::uint64_t nodeSize = 24;

// ---- The head of a heap: positions in the segment

/// The tree of free blocks.
inline constexpr std::uint64_t freeBlocksAt = 0;
/// A word that is always `extraBytes`: what of the head comes behind the first `algorithmSize` bytes.
inline constexpr std::uint64_t extraBytesAt = 32;
inline constexpr std::uint64_t extraBytes = 64;
/// Bytes in allocated blocks, their marks included.
inline constexpr std::uint64_t allocatedAt = 40;
/// Bytes of the segment.
inline constexpr std::uint64_t heapSizeAt = 48;
inline constexpr std::uint64_t algorithmSize = 56;
/// The trees of named objects and of unique ones.
inline constexpr std::uint64_t namedObjectsAt = 56;
inline constexpr std::uint64_t uniqueObjectsAt = 88;
inline constexpr std::uint64_t headSize = 120;

// ---- Blocks

/// Blocks have a multiple of this, and begin at a multiple of it.
inline constexpr std::uint64_t blockUnit = 16;
inline constexpr std::uint64_t firstBlockAt = 128;

// ---- A named object: a node, a description, the object at its alignment, its name, a zero byte

/// In front of the object, and a multiple of the object's alignment where that is larger.
inline constexpr std::uint64_t descriptionSize = 16;
/// In the description: the bytes of the object (a word), and those of its name (2).
inline constexpr std::uint64_t objectSizeAt = 0;
inline constexpr std::uint64_t nameLengthAt = 8;
/// The last four bytes of the description have no meaning. The library leaves zeros there.
inline constexpr std::uint64_t descriptionPaddingAt = 12;
inline constexpr std::uint64_t descriptionPaddingSize = 4;

// ---- A list: two pointers to its heap, its map, the entries of that, and the two ends of the list

inline constexpr std::uint64_t listSize = 96;
/// A pointer to the map: an array of pointers to blocks of elements. Null, with all that follows, before first use.
inline constexpr std::uint64_t mapAt = 16;
/// How many entries the map has.
inline constexpr std::uint64_t mapEntriesAt = 24;
/// Where the list begins and ends: pointers to the element, to the begin and the end of its block, and to the block's
/// entry in the map. The end is the place behind the last element.
inline constexpr std::uint64_t beginAt = 32;
inline constexpr std::uint64_t endAt = 64;

// ---- The header: the named object of the header segment

inline constexpr char headerName[] = "segment_data";
inline constexpr std::uint64_t headerSize = 192;
inline constexpr std::uint64_t headerAlignment = 8;
/// The list of rows, one for each segment behind the header segment, by index.
inline constexpr std::uint64_t tableAt = 0;
/// The list of saved vectors, each a list of words, the oldest first.
inline constexpr std::uint64_t queueAt = 96;

/// A row of the table: the segment's position in the file, a signed word, and its bytes.
inline constexpr std::uint64_t rowSize = 16;
inline constexpr std::uint64_t rowOffsetAt = 0;
inline constexpr std::uint64_t rowLengthAt = 8;
/// The position of a segment for which the file could not grow.
inline constexpr std::int64_t noOffset = -1;

inline constexpr std::uint64_t wordSize = 8;
/// Elements in a block of each of the three kinds of list.
inline constexpr std::uint64_t rowsInBlock = 32;
inline constexpr std::uint64_t vectorsInBlock = 5;
inline constexpr std::uint64_t wordsInBlock = 64;

} // namespace kvt::ex::mmap::segment_file
