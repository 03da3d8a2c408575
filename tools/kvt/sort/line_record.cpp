#include "sort/line_record.h"

#include "sort/workspace.h"

#include <algorithm>

namespace host {

namespace {

// Shorter keys are compared in one go.
constexpr std::size_t longKey = 4 * 1024 * 1024;
constexpr std::size_t comparedAtOnce = 256 * 1024;

bool hasFields(const LineRecord& record) {
    return record.payload || record.count != 1 || record.place != 0;
}

std::uint64_t varintSize(std::uint64_t value) {
    return (static_cast<std::uint64_t>(std::bit_width(value | 1)) + 6) / 7;
}

char* writeVarint(char* out, std::uint64_t value) {
    for (; value >= 0x80; value >>= 7) {
        *out++ = static_cast<char>(value | 0x80);
    }
    *out++ = static_cast<char>(value);
    return out;
}

const char* readVarint(const char* in, std::uint64_t& value) {
    value = 0;
    for (unsigned shift = 0;; shift += 7) {
        const auto byte = static_cast<unsigned char>(*in++);
        value |= std::uint64_t{byte & 0x7Fu} << shift;
        if (byte < 0x80) {
            return in;
        }
    }
}

std::uint64_t payloadSize(const LineRecord& record) {
    return record.payload ? record.payload->size() : 0;
}

std::uint64_t payloadNumber(const LineRecord& record) {
    return record.payload ? record.payload->size() + 1 : 0;
}

} // namespace

std::uint64_t encodedSize(const LineRecord& record) {
    const std::uint64_t size = varintSize(record.key.size() * 2) + record.key.size();
    return hasFields(record) ? size + varintSize(payloadNumber(record)) + varintSize(record.count) +
                                   varintSize(record.place) + payloadSize(record)
                             : size;
}

char* encodeHeader(char* out, const LineRecord& record) {
    const bool more = hasFields(record);
    out = writeVarint(out, record.key.size() * 2 + (more ? 1 : 0));
    if (more) {
        out = writeVarint(out, payloadNumber(record));
        out = writeVarint(out, record.count);
        out = writeVarint(out, record.place);
    }
    return out;
}

const char* decode(const char* in, LineRecord& record) {
    std::uint64_t first = 0;
    in = readVarint(in, first);
    std::uint64_t payload = 0;
    record.count = 1;
    record.place = 0;
    if ((first & 1) != 0) {
        in = readVarint(in, payload);
        in = readVarint(in, record.count);
        in = readVarint(in, record.place);
    }
    record.key = {in, first / 2};
    in += first / 2;
    record.payload.reset();
    if (payload == 0) {
        return in;
    }
    record.payload = std::string_view(in, payload - 1);
    return in + payload - 1;
}

int compareFrom(std::string_view left, std::string_view right, std::size_t depth,
                const Workspace& workspace) {
    left.remove_prefix(depth);
    right.remove_prefix(depth);
    while (std::min(left.size(), right.size()) > longKey) {
        const std::string_view leftPiece = left.substr(0, comparedAtOnce);
        const std::string_view rightPiece = right.substr(0, comparedAtOnce);
        const int order = leftPiece.compare(rightPiece);
        workspace.letGo(leftPiece);
        workspace.letGo(rightPiece);
        if (order != 0) {
            return order;
        }
        left.remove_prefix(comparedAtOnce);
        right.remove_prefix(comparedAtOnce);
    }
    return left.compare(right);
}

} // namespace host
