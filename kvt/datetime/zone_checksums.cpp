// Checksums of zone files, as the command cksum of POSIX prints them, so that anybody can check them by hand:
//
//     cksum africa antarctica asia ... | diff - kvt-checksums
//
// The checksum is that of POSIX.1-2017, "cksum": the remainder by the generator of Ethernet's CRC (ISO/IEC 8802-3),
// over the bytes, then over their number from its lowest byte on, in the end complemented.

#include <kvt/datetime/detail/zone_files.h>

namespace kvt::ex::datetime {

namespace {

constexpr std::uint32_t generator = 0x04C11DB7;

constexpr std::array<std::uint32_t, 256> remainders = [] {
    std::array<std::uint32_t, 256> table{};
    for (std::uint32_t byte = 0; byte < 256; ++byte) {
        std::uint32_t remainder = byte << 24;
        for (int bit = 0; bit < 8; ++bit) {
            remainder = remainder << 1 ^ ((remainder & 0x80000000) != 0 ? generator : 0);
        }
        table[byte] = remainder;
    }
    return table;
}();

constexpr std::uint32_t withByte(std::uint32_t sum, unsigned char byte) noexcept {
    return sum << 8 ^ remainders[(sum >> 24) ^ byte];
}

std::uint32_t checksum(std::string_view text) noexcept {
    std::uint32_t sum = 0;
    for (const char c : text) {
        sum = withByte(sum, static_cast<unsigned char>(c));
    }
    for (std::size_t count = text.size(); count != 0; count >>= 8) {
        sum = withByte(sum, static_cast<unsigned char>(count & 0xFF));
    }
    return ~sum;
}

} // namespace

std::string zoneChecksums(const ZoneFiles& files) {
    std::string lines;
    for (const std::string_view name : detail::zoneFileNames) {
        const auto file = files.find(std::string(name));
        const std::string_view text = file == files.end() ? std::string_view() : file->second;
        lines += std::to_string(checksum(text)) + " " + std::to_string(text.size()) + " ";
        lines.append(name) += "\n";
    }
    return lines;
}

} // namespace kvt::ex::datetime
