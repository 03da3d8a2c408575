// A stream cut into blocks at any byte: the same bytes and the same losses as in one block, and the same bytes as ICU
// gives for the whole text.
//
// Input: source encoding, target encoding, a seed for the cuts, then the text.
#include <fuzzing.h>

#include <kvt/encoding/stream_transcoder.h>

#include <random>
#include <sstream>
#include <vector>

using namespace kvt::ex;
using namespace kvt::fuzz;

namespace {

struct Result {
    std::string bytes;
    std::vector<Loss> losses;

    friend bool operator==(const Result& left, const Result& right) {
        const auto equal = [](const Loss& a, const Loss& b) {
            return a.kind == b.kind && a.offset == b.offset && a.bytes == b.bytes &&
                   a.codePoint == b.codePoint;
        };
        return left.bytes == right.bytes && std::equal(left.losses.begin(), left.losses.end(),
                                                       right.losses.begin(), right.losses.end(), equal);
    }
    friend std::ostream& operator<<(std::ostream& stream, const Result& result) {
        stream << kvt::test::hex(result.bytes, 200);
        for (const Loss& loss : result.losses) {
            stream << "\n  kind " << loss.kind << " at " << loss.offset << " bytes "
                   << kvt::test::hex(loss.bytes) << " code point "
                   << static_cast<std::uint32_t>(loss.codePoint);
        }
        return stream;
    }
};

/// SCSU has many spellings of one text, and ICU chooses by what it sees of it at a time: there the text has to be equal.
std::string comparable(const std::string& encoding, const std::string& bytes) {
    return encoding == "SCSU" ? kvt::test::convertWithIcu(encoding, "UTF-8", bytes).bytes : bytes;
}

/// Converts in blocks of the lengths that `nextLength` gives.
template <typename NextLength>
Result convert(StreamTranscoder& transcoder, const std::string& to, std::string_view text,
               NextLength nextLength) {
    Result result;
    const auto onLoss = [&](const Loss& loss) { result.losses.push_back(loss); };
    for (std::size_t at = 0; at < text.size();) {
        // A block of its own, so that reading beyond it shows.
        const std::string block(text.substr(at, nextLength()));
        transcoder.convert(block, result.bytes, onLoss);
        at += block.size();
        requireEqual(transcoder.position(), at, "position");
    }
    transcoder.finish(result.bytes, onLoss);
    result.bytes = comparable(to, result.bytes);
    return result;
}

} // namespace

int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    Input input(data, size);
    const std::string from = input.pick(encodings);
    const std::string to = input.pick(encodings);
    const unsigned seed = input.byte();
    const std::string_view text = input.rest();
    const std::string what =
        from + " to " + to + ", seed " + std::to_string(seed) + ", of " + kvt::test::hex(text, 400);

    StreamTranscoder transcoder{Encoding(from), Encoding(to)};
    const Result whole = convert(transcoder, to, text, [&] { return text.size(); });
    if (!text.empty()) {
        requireEqual(kvt::test::hex(whole.bytes, 400),
                     kvt::test::hex(comparable(to, kvt::test::convertWithIcu(from, to, text).bytes), 400),
                     what + ", whole");
    }
    std::uint64_t before = 0;
    for (const Loss& loss : whole.losses) {
        require(loss.offset >= before && loss.offset <= text.size(), what + ": losses out of order");
        before = loss.offset;
        if (loss.kind == Loss::BadInput) {
            require(text.substr(loss.offset, loss.bytes.size()) == loss.bytes,
                    what + ": not the bytes at the place");
        }
    }
    std::mt19937 random(seed);
    requireEqual(convert(transcoder, to, text, [&] { return 1 + random() % (1 + seed % 9); }), whole,
                 what + ", cut");
    requireEqual(convert(transcoder, to, text, [] { return 1U; }), whole, what + ", byte by byte");
    return 0;
}
