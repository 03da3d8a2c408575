#include <reference/stream_reference.h>

#include <reference/icu_reference.h>

#include <kvt/encoding/icu_transcoder.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <sstream>

namespace kvt::test {
namespace {

using kvt::ex::Encoding;
using kvt::ex::ICUTranscoder;
using kvt::ex::Loss;
using kvt::ex::StreamTranscoder;

struct Result {
    std::string bytes;
    std::vector<Loss> losses;
};

bool isSame(const Loss& left, const Loss& right) {
    return left.kind == right.kind && left.offset == right.offset && left.bytes == right.bytes &&
           left.codePoint == right.codePoint;
}

/// Converts a first block, and all that follows in blocks of another length.
Result converted(StreamTranscoder& stream, std::string_view text, std::size_t first, std::size_t others) {
    Result result;
    const auto onLoss = [&](const Loss& loss) { result.losses.push_back(loss); };
    for (std::size_t length = first; !text.empty(); length = others) {
        // A block of its own, so that reading beyond it shows.
        const std::string block(text.substr(0, length));
        stream.convert(block, result.bytes, onLoss);
        text.remove_prefix(block.size());
    }
    stream.finish(result.bytes, onLoss);
    return result;
}

std::string transcoded(const std::string& from, const std::string& to, std::string_view text) {
    std::string out;
    try {
        ICUTranscoder(Encoding(from), Encoding(to)).transcode<char, char>(text, out);
    } catch (const kvt::ex::UStringException&) {
        // The substituted text is in `out`.
    }
    return out;
}

/// Whether ICU drops the last bytes of a text without a word, though they begin something. How the text would go on shows
/// it: "!" is not a character of its own in HZ, nor the first half of one, and "-" makes a "+" of the one before it in
/// UTF-7, where bits of 0 that were left over become a third character with the 42 of seven "A".
bool forgetsTheEnd(const std::string& from, const std::string& text) {
    const auto decoded = [&](const std::string& more) {
        return convertWithIcu(from, "UTF-8", text + more).bytes;
    };
    const std::string before = decoded("");
    if (from == "HZ-GB-2312") {
        return decoded("!") != before && decoded("!") != before + "!";
    }
    return from == "UTF-7" &&
           (decoded("-") == before + "+" || decoded("AAAAAAA") == before + std::string(3, '\0'));
}

/// These have many spellings of one text, and ICU chooses by what it sees of it at a time; or they write an
/// announcement that ICU leaves out where a conversion begins with a reset. Of these the text has to be equal.
std::string comparable(const std::string& to, const std::string& bytes) {
    const bool hasSpellings =
        to == "SCSU" || to == "LMBCS-1" || to == "ISO-2022-KR" || to == "ISO_2022,locale=ko,version=1";
    return hasSpellings ? convertWithIcu(to, "UTF-8", bytes).bytes : bytes;
}

std::string shown(const std::vector<Loss>& losses) {
    std::ostringstream text;
    for (const Loss& loss : losses) {
        text << (loss.kind == Loss::BadInput ? " bad" : " lost") << '@' << loss.offset << '['
             << hex(loss.bytes) << "] U+" << std::hex << static_cast<std::uint32_t>(loss.codePoint)
             << std::dec;
    }
    return text.str();
}

/// What is wrong with the losses of a whole text, beside what ICU's callbacks saw.
std::string wrongLosses(const std::string& from, const std::string& to, std::string_view text,
                        const Result& whole, const Losses& expected) {
    std::vector<std::string> bad;
    std::vector<char32_t> characters;
    std::uint64_t before = 0;
    for (const Loss& loss : whole.losses) {
        if (loss.kind == Loss::BadInput) {
            bad.push_back(loss.bytes);
        } else {
            characters.push_back(loss.codePoint);
        }
        if (loss.offset < before || loss.offset > text.size() ||
            text.substr(loss.offset, loss.bytes.size()) != loss.bytes) {
            return "a loss is not at its place";
        }
        // Where ICU says that something is missing at the end, there may be no bytes for it.
        if (loss.bytes.empty() && loss.offset != text.size()) {
            return "a loss without its bytes";
        }
        before = loss.offset;
    }
    // ICU names a Devanagari letter for one of another script that ISCII lacks.
    const bool areSame = to.starts_with("ISCII") ? characters.size() == expected.characters.size()
                                                 : characters == expected.characters;
    if (!areSame) {
        return "other characters are lost than " + std::to_string(expected.characters.size());
    }
    if (bad.size() != expected.badInput.size()) {
        return "bad input at other places than " + std::to_string(expected.badInput.size());
    }
    // These hold more than they count, and ICU shows other bytes for one call with the text than for many.
    const bool isVague = from == "BOCU-1" || from == "SCSU" || from == "UTF-7" ||
                         from == "IMAP-mailbox-name" || from.starts_with("ISCII");
    for (std::size_t i = 0; i < bad.size() && !isVague; ++i) {
        if (!expected.badInput[i].empty() && bad[i] != expected.badInput[i]) {
            return "other bytes are bad than " + hex(expected.badInput[i]);
        }
    }
    return {};
}

} // namespace

std::string differenceInStream(const std::string& from, const std::string& to, std::string_view text,
                               const std::vector<std::size_t>& cuts) {
    StreamTranscoder stream{Encoding(from), Encoding(to)};
    const Result whole = converted(stream, text, text.size(), text.size());
    const auto what = [&] {
        return from + " to " + to + " of " + std::to_string(text.size()) + " bytes " + hex(text, 60) +
               " ... " + hex(text.substr(text.size() - std::min(text.size(), std::size_t{60}))) +
               ", with losses" + shown(whole.losses) + ": ";
    };
    // Broken escape sequences of this one mean to ICU what the end of a call makes of them.
    if (from != "x11-compound-text") {
        std::string expected = transcoded(from, to, text);
        Losses losses = lossesOfIcu(from, to, text);
        if (forgetsTheEnd(from, std::string(text))) {
            const std::string marked = transcoded(from, "UTF-8", text) + "\uFFFD";
            expected = to == "UTF-8" ? marked : transcoded("UTF-8", to, marked);
            losses.badInput.emplace_back();
        }
        if (comparable(to, whole.bytes) != comparable(to, expected)) {
            return what() + hex(whole.bytes) + " in place of " + hex(expected);
        }
        const std::string wrong = wrongLosses(from, to, text, whole, losses);
        if (!wrong.empty()) {
            return what() + wrong;
        }
    }
    for (const std::size_t cut : cuts) {
        for (const std::size_t others : {cut, text.size()}) {
            const Result result = converted(stream, text, cut, others);
            const auto blocks = [&] {
                return what() + "in blocks of " + std::to_string(cut) + " and " + std::to_string(others) +
                       ' ';
            };
            if (comparable(to, result.bytes) != comparable(to, whole.bytes)) {
                return blocks() + hex(result.bytes) + " in place of " + hex(whole.bytes);
            }
            if (!std::equal(result.losses.begin(), result.losses.end(), whole.losses.begin(),
                            whole.losses.end(), isSame)) {
                return blocks() + "the losses" + shown(result.losses);
            }
        }
    }
    return {};
}

} // namespace kvt::test
