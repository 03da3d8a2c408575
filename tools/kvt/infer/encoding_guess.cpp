#include "infer/encoding_guess.h"

#include "infer/charset_detector.h"
#include "text/byte_order_mark.h"
#include "text/encoding_catalogue.h"

#include <algorithm>
#include <array>
#include <tuple>

namespace host {

namespace {

using kvt::ex::Encoding;

// Longer marks first: that of UTF-32LE begins like that of UTF-16LE.
constexpr std::array<const char*, 5> markedEncodings = {"UTF-32LE", "UTF-32BE", "UTF-8", "UTF-16LE",
                                                        "UTF-16BE"};

std::string markedEncoding(std::string_view beginning) {
    for (const char* const name : markedEncodings) {
        if (const std::string_view mark = byteOrderMark(namedEncoding(name));
            !mark.empty() && beginning.starts_with(mark)) {
            return name;
        }
    }
    return "";
}

// Text in wide units has zero bytes where text in bytes has none: mostly in one place of each unit.
std::string encodingOfZeros(std::string_view beginning) {
    std::array<std::size_t, 4> zeros{};
    for (std::size_t at = 0; at < beginning.size(); ++at) {
        zeros[at % 4] += beginning[at] == '\0' ? 1 : 0;
    }
    const std::size_t many = beginning.size() / 4 / 4; // a quarter of what one place could have
    const auto are = [&](std::size_t place) { return zeros[place] > many; };
    if (are(1) && are(2) && are(3)) {
        return "UTF-32LE";
    }
    if (are(0) && are(1) && are(2)) {
        return "UTF-32BE";
    }
    if (are(1) && are(3)) {
        return "UTF-16LE";
    }
    return are(0) && are(2) ? "UTF-16BE" : "";
}

// What people mean by the detector's answer: it has the same letters, and more.
std::string widerEncoding(const std::string& name) {
    return name == "ISO-8859-1" ? "windows-1252" : name;
}

bool isAsciiText(std::string_view bytes) {
    return std::none_of(bytes.begin(), bytes.end(),
                        [](char c) { return static_cast<unsigned char>(c) >= 0x80 || c == '\x1B'; });
}

// The best is the least. UTF-8 does not come about by chance: a few places that are not cannot speak against it. But
// text of seven bits that is more than ASCII is valid UTF-8, too, and says nothing.
auto rankOf(const EncodingOpinion& opinion, bool isAscii) {
    constexpr std::uint64_t mostlyRight = 8;
    const bool isUtf8 = opinion.encoding == Encoding::Utf8 && (isAscii || opinion.beyondAscii > 0);
    const bool isRight =
        opinion.losses == 0 || (isUtf8 && opinion.beyondAscii > mostlyRight * opinion.losses);
    return std::tuple(!isRight, !isUtf8, isRight ? 0 : opinion.losses, opinion.controls, -opinion.confidence);
}

} // namespace

EncodingGuess::EncodingGuess(std::string_view beginning) {
    if (const std::string marked = markedEncoding(beginning); !marked.empty()) {
        isMarked_ = true;
        consider(marked, 0);
        return;
    }
    if (const std::string wide = encodingOfZeros(beginning); !wide.empty()) {
        consider(wide, 0);
        return;
    }
    consider("UTF-8", 0);
    constexpr std::size_t mostCandidates = 4;
    for (const CharsetGuess& guess : detectCharsets(beginning)) {
        if (candidates_.size() < mostCandidates && !guess.name.starts_with("UTF-")) {
            consider(widerEncoding(guess.name), guess.confidence);
        }
    }
    consider("windows-1252", 0);
}

void EncodingGuess::consider(const std::string& name, int confidence) {
    const Encoding encoding = namedEncoding(name);
    const bool isKnown = std::any_of(candidates_.begin(), candidates_.end(), [&](const Candidate& candidate) {
        return candidate.opinion.encoding == encoding;
    });
    if (isKnown || encoding.id() == Encoding::Unknown) {
        return;
    }
    EncodingOpinion opinion(encoding, name);
    opinion.confidence = confidence;
    candidates_.push_back({std::move(opinion), kvt::ex::StreamTranscoder(encoding, Encoding::Utf8)});
}

void EncodingGuess::take(Candidate& candidate, std::string_view bytes, bool isEnd) {
    EncodingOpinion& opinion = candidate.opinion;
    decoded_.clear();
    const auto onLoss = [&](const kvt::ex::Loss& loss) {
        ++opinion.losses;
        opinion.firstLoss = opinion.firstLoss.value_or(loss.offset);
    };
    if (isEnd) {
        candidate.decoder.finish(decoded_, onLoss);
    } else {
        candidate.decoder.convert(bytes, decoded_, onLoss);
    }
    for (std::size_t at = 0; at < decoded_.size(); ++at) {
        const auto byte = static_cast<unsigned char>(decoded_[at]);
        opinion.beyondAscii += byte >= 0xC0 ? 1 : 0;
        opinion.controls += byte == 0xC2 && static_cast<unsigned char>(decoded_[at + 1]) < 0xA0 ? 1 : 0;
    }
}

void EncodingGuess::add(std::string_view bytes) {
    isAscii_ = isAscii_ && isAsciiText(bytes);
    for (Candidate& candidate : candidates_) {
        take(candidate, bytes, false);
    }
}

const EncodingOpinion& EncodingGuess::likeliest() const {
    return std::min_element(candidates_.begin(), candidates_.end(),
                            [&](const Candidate& left, const Candidate& right) {
                                return rankOf(left.opinion, isAscii_) < rankOf(right.opinion, isAscii_);
                            })
        ->opinion;
}

const std::vector<EncodingOpinion>& EncodingGuess::finish() {
    for (Candidate& candidate : candidates_) {
        take(candidate, {}, true);
        opinions_.push_back(candidate.opinion);
    }
    std::stable_sort(opinions_.begin(), opinions_.end(),
                     [&](const EncodingOpinion& left, const EncodingOpinion& right) {
                         return rankOf(left, isAscii_) < rankOf(right, isAscii_);
                     });
    return opinions_;
}

} // namespace host
