// Zone files as the system's own zone compiler, zic(8), takes them: whether it does, and the offsets that it makes of them.
#pragma once

#include <cstdint>
#include <filesystem>
#include <string>
#include <vector>

namespace kvt::test {

/// Whether this machine has a zone compiler.
bool hasZoneCompiler();

struct Compilation {
    bool isGood = false;
    std::string printed; ///< its errors and warnings
};

/// Has it compile the files `sources` of the folder `from` into the folder `to`, which is made where it is not.
/// Changes are written out up to 2037. std::runtime_error where there is no compiler.
Compilation compileZones(const std::filesystem::path& from, const std::vector<std::string>& sources,
                         const std::filesystem::path& to);

/// A zone as it was compiled. Moments are seconds since 1970 in UTC, offsets are seconds.
struct CompiledZone {
    std::vector<std::int64_t> moments; ///< of the changes, in order
    std::vector<std::int64_t> offsets; ///< from each of them on
    std::int64_t first = 0;            ///< the offset before all changes

    std::int64_t offsetAt(std::int64_t moment) const;
};

/// The file as RFC 8536 describes it, its second, 64-bit half; std::runtime_error where it is not one.
CompiledZone readCompiledZone(const std::filesystem::path& file);

} // namespace kvt::test
