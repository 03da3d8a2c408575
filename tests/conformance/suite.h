// One body of cases that others wrote, and the row of docs/trust.md that says how it went.
//
// The tests of this folder read such bodies where Debian's packages have put them, or from source packages that
// `./dev` has fetched; none is part of this repository. A case is passed, or it is left out for a reason that the page
// says with the number of the cases; a case that is neither fails the test.
#pragma once

#include <cstddef>
#include <map>
#include <string>
#include <vector>

namespace conformance {

class Suite {
public:
    /// `name` is the first cell of the row. `data` says which version of which data the cases come from, and of what
    /// else the outcome depends on; the figures of the page hold for one such text alone.
    Suite(std::string name, std::string data);

    /// Counts a case that was run; `what` describes one that did not pass.
    void check(bool passed, const std::string& what);
    /// Counts cases that are not run.
    void leaveOut(const std::string& reason, std::size_t cases = 1);

    /// Shows what failed, the first of them in full, and compares the row of the page where it speaks of this data.
    /// To be called once, at the end.
    void finish() const;

private:
    std::string name_;
    std::string data_;
    std::size_t run_ = 0;
    std::vector<std::string> failed_;
    std::map<std::string, std::size_t> leftOut_;
};

/// The folder in which `./dev` keeps what it took from a source package; "" without it.
std::string sourceFolder(const std::string& package);
/// The upstream version of that source package.
std::string sourceVersion(const std::string& package);
/// Why a test that needs the source package is skipped.
std::string noSources(const std::string& package);

/// The upstream version of an installed Debian package: "2.36" of "2.36-9+deb12u7"; "" where it is not installed.
std::string packageVersion(const std::string& package);

/// What a program prints on its standard output. Throws std::runtime_error where it cannot be run or fails.
std::string outputOf(const std::string& commandLine);

/// The bytes of a file. Throws std::runtime_error where it cannot be read.
std::string contentsOf(const std::string& path);
std::vector<std::string> linesOf(const std::string& text);

/// The bytes that `character` has in UTF-8.
std::string utf8(char32_t character);
/// Bytes in hexadecimal digits.
std::string hex(const std::string& bytes);

} // namespace conformance
