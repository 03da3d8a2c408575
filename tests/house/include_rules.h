// The arrows between the folders, as rules over `#include` lines.
//
// A Tree is what the rules look at: which files there are and what each includes. readTree takes it from disk; tests
// of the rules themselves build small ones by hand. Each rule gives its offences, one line of text for each, which
// begins with the file and line.
#pragma once

#include <filesystem>
#include <set>
#include <string>
#include <vector>

namespace house {

struct Include {
    std::string file; // from the root of the repository, as is `target` where it is one of ours
    int line;
    std::string target;
    bool angled;
};

struct Tree {
    std::set<std::string> files;
    std::set<std::string> publicHeaders;
    std::set<std::string> optionalHeaders; // those among them that are for users of another library
    std::vector<Include> includes;
};

using Offences = std::vector<std::string>;

/// Reads all C++ files under `kvt` and `tools` of the repository at `root`; the two lists are files that name the
/// public headers and the optional ones among them, one a line.
Tree readTree(const std::filesystem::path& root, const std::filesystem::path& publicHeaderList,
              const std::filesystem::path& optionalHeaderList);

/// The `#include` lines of one text.
std::vector<Include> includesOf(const std::string& file, const std::string& text);

/// The library's own headers are included as <kvt/...>, and exist.
Offences ownHeadersAreNamedFromTheRoot(const Tree& tree);
/// No header includes itself by way of others.
Offences noCycles(const Tree& tree);
/// Each folder includes only what it may know of the others.
Offences foldersKnowOnlyTheirNeighbours(const Tree& tree);
/// pimpl.h and memory.h reach no header about strings, not even through another header.
Offences memoryKnowsNoString(const Tree& tree);
/// A public header includes public headers, and none of the libraries that are used behind them. An optional header
/// is included by no other and may include the library that it is for.
Offences publicHeadersStandAlone(const Tree& tree);
/// Headers outside detail/ and platform/ are the public ones, and <kvt/kvt.h> includes them all but the optional ones.
Offences everyHeaderIsPublicOrPrivate(const Tree& tree);
/// ICU, Boost.DateTime and the operating system are touched in the files that are there for it; in the command, CLI11.
Offences outsideIsBehindItsDoor(const Tree& tree);
/// The command uses the public headers only.
Offences toolsUsePublicHeaders(const Tree& tree);
/// Each room of the command includes, as "room/file.h", only what it may know of the other rooms.
Offences roomsKnowOnlyTheirNeighbours(const Tree& tree);

} // namespace house
