// Conversion of a text of 64 KiB, and of a name of 14 bytes, by the library and by what one would use instead:
//
//     kvt     ICUTranscoder into a std::string that is used again
//     icu     ucnv_convertEx with two open converters, into a buffer that is large enough
//     iconv   the C library's iconv with an open descriptor, into such a buffer
//     copy    memcpy of the source, the ceiling for anything that has to read the text
//
// A benchmark is called WAY/PAIR/TEXT. Bytes per second are those of the source.
#include <kvt/encoding/icu_transcoder.h>
#include <kvt/encoding/stream_transcoder.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <benchmark/benchmark.h>

#include <unicode/ucnv.h>

#include <iconv.h>

#include <cerrno>
#include <cstring>
#include <memory>
#include <random>
#include <sstream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <vector>

namespace {

using namespace kvt::ex;

constexpr std::size_t textBytes = 64 * 1024;

struct Text {
    const char* name;
    const char* sample; ///< UTF-8
};
const Text texts[] = {
    {"ascii", "The quick brown fox jumps over the lazy dog, and the dog does not mind it. "},
    {"latin", "Größere Brücken führen über die Flüsse; l'été, déjà, où l'élève rêve à côté. "},
    {"cyrillic", "Широкая электрификация южных губерний даст мощный толчок подъёму хозяйства. "},
    {"cjk", "春眠不覺曉， 處處聞啼鳥。 夜來風雨聲， 花落知多少。 白日依山盡， 黃河入海流。"},
};

struct Pair {
    const char* from;
    const char* to;
    const char* onlyText; ///< null for all texts
};
const Pair pairs[] = {
    {"UTF-8", "UTF-16LE", nullptr},        {"UTF-16LE", "UTF-8", nullptr},
    {"UTF-8", "UTF-32LE", nullptr},        {"UTF-32LE", "UTF-8", nullptr},
    {"UTF-16LE", "UTF-16BE", nullptr},     {"windows-1252", "UTF-8", "ascii"},
    {"windows-1252", "UTF-8", "latin"},    {"UTF-8", "windows-1252", "ascii"},
    {"UTF-8", "windows-1252", "latin"},    {"windows-1252", "UTF-16LE", "latin"},
    {"UTF-16LE", "windows-1252", "latin"}, {"ISO-8859-1", "UTF-8", "latin"},
    {"UTF-8", "ISO-8859-1", "latin"},      {"windows-1251", "UTF-8", "cyrillic"},
    {"UTF-8", "windows-1251", "cyrillic"}, {"KOI8-R", "UTF-8", "cyrillic"},
    {"UTF-8", "KOI8-R", "cyrillic"},       {"KOI8-R", "windows-1251", "cyrillic"},
    {"IBM037", "UTF-8", "ascii"},          {"UTF-8", "IBM037", "ascii"},
    {"Shift_JIS", "UTF-8", "ascii"},       {"GBK", "UTF-8", "cjk"},
};

std::string convert(std::string_view text, const char* from, const char* to) {
    std::string out;
    ICUTranscoder{Encoding(from), Encoding(to)}.transcode(text, out);
    return out;
}

/// The words of the sample in a random order, in the source encoding of a pair. In a text that repeats itself a
/// processor foresees where the next character of several bytes stands, as it does in no other.
std::string sourceText(const Text& text, const char* encoding) {
    std::vector<std::string> words;
    std::istringstream sample(text.sample);
    for (std::string word; sample >> word;) {
        words.push_back(word + ' ');
    }
    std::mt19937 random(1);
    std::string utf8;
    while (utf8.size() < textBytes) {
        utf8 += words[random() % words.size()];
    }
    return convert(utf8, "UTF-8", encoding);
}

void count(benchmark::State& state, std::size_t bytes) {
    state.SetBytesProcessed(static_cast<std::int64_t>(state.iterations()) * static_cast<std::int64_t>(bytes));
}

void byKvt(benchmark::State& state, const Pair& pair, const std::string& source) {
    ICUTranscoder transcoder{Encoding(pair.from), Encoding(pair.to)};
    std::string out;
    for (auto _ : state) {
        transcoder.transcode(kvt::future::string_view(source), out);
        benchmark::DoNotOptimize(out.data());
    }
    count(state, source.size());
}

struct Close {
    void operator()(UConverter* converter) const { ucnv_close(converter); }
};
using Converter = std::unique_ptr<UConverter, Close>;

Converter open(const char* name) {
    UErrorCode error = U_ZERO_ERROR;
    Converter converter(ucnv_open(name, &error));
    if (U_FAILURE(error)) {
        throw std::runtime_error(name);
    }
    return converter;
}

void byIcu(benchmark::State& state, const Pair& pair, const std::string& source) {
    const Converter from = open(pair.from);
    const Converter to = open(pair.to);
    std::string out(source.size() * 4 + 16, '\0');
    for (auto _ : state) {
        UChar pivot[1024];
        UChar* pivotSource = pivot;
        UChar* pivotTarget = pivot;
        const char* in = source.data();
        char* target = out.data();
        UErrorCode error = U_ZERO_ERROR;
        ucnv_convertEx(to.get(), from.get(), &target, out.data() + out.size(), &in,
                       source.data() + source.size(), pivot, &pivotSource, &pivotTarget, pivot + 1024, true,
                       true, &error);
        if (U_FAILURE(error)) {
            state.SkipWithError(u_errorName(error));
            break;
        }
        benchmark::DoNotOptimize(out.data());
    }
    count(state, source.size());
}

void byIconv(benchmark::State& state, const Pair& pair, const std::string& source) {
    const iconv_t descriptor = iconv_open(pair.to, pair.from);
    if (descriptor == reinterpret_cast<iconv_t>(-1)) {
        state.SkipWithError("iconv does not know it");
        return;
    }
    std::string out(source.size() * 4 + 16, '\0');
    std::string in = source; // iconv wants a pointer to what is not const
    for (auto _ : state) {
        char* position = in.data();
        std::size_t left = in.size();
        char* target = out.data();
        std::size_t room = out.size();
        if (iconv(descriptor, &position, &left, &target, &room) == static_cast<std::size_t>(-1)) {
            state.SkipWithError(std::strerror(errno));
            break;
        }
        benchmark::DoNotOptimize(out.data());
    }
    iconv_close(descriptor);
    count(state, source.size());
}

void byCopy(benchmark::State& state, const Pair&, const std::string& source) {
    std::string out(source.size(), '\0');
    for (auto _ : state) {
        std::memcpy(out.data(), source.data(), source.size());
        benchmark::DoNotOptimize(out.data());
        benchmark::ClobberMemory();
    }
    count(state, source.size());
}

/// UTF-8 to ASCII as the strings do it: one pass that looks for what is not ASCII.
void asciiCheck(benchmark::State& state) {
    const Utf8String source(sourceText(texts[0], "UTF-8").c_str());
    AsciiString target;
    for (auto _ : state) {
        target.assign(source);
        benchmark::DoNotOptimize(target.rawData());
    }
    count(state, source.size());
}

void construct(benchmark::State& state) {
    for (auto _ : state) {
        ICUTranscoder transcoder(Encoding::Utf8, Encoding::Utf16LE);
        benchmark::DoNotOptimize(&transcoder);
    }
}

void constructByName(benchmark::State& state) {
    for (auto _ : state) {
        ICUTranscoder transcoder(Encoding("Shift_JIS"), Encoding("windows-1252"));
        benchmark::DoNotOptimize(&transcoder);
    }
}

/// The first text of an encoding, which for one byte beyond ASCII brings about the tables.
void firstText(benchmark::State& state, const char* text) {
    for (auto _ : state) {
        StreamTranscoder transcoder(Encoding("windows-1252"), Encoding::Utf8);
        std::string out;
        transcoder.convert(text, out, nullptr);
        benchmark::DoNotOptimize(out.data());
    }
}
void firstAscii(benchmark::State& state) {
    firstText(state, "e");
}
void firstLatin(benchmark::State& state) {
    firstText(state, "\xE9");
}

void openInIcu(benchmark::State& state) {
    for (auto _ : state) {
        const Converter from = open("Shift_JIS");
        const Converter to = open("windows-1252");
        benchmark::DoNotOptimize(from.get());
        benchmark::DoNotOptimize(to.get());
    }
}

void openInIconv(benchmark::State& state) {
    for (auto _ : state) {
        iconv_t descriptor = iconv_open("WINDOWS-1252", "SHIFT_JIS");
        benchmark::DoNotOptimize(descriptor);
        iconv_close(descriptor);
    }
}

template <std::uint32_t N>
void makeString(benchmark::State& state) {
    for (auto _ : state) {
        const UString<N> string("Reykjavík 871", 14, Encoding::Utf8);
        benchmark::DoNotOptimize(string.rawData());
    }
}

void registerAll() {
    using Way = void (*)(benchmark::State&, const Pair&, const std::string&);
    const std::pair<const char*, Way> ways[] = {
        {"kvt", byKvt}, {"icu", byIcu}, {"iconv", byIconv}, {"copy", byCopy}};
    for (const Pair& pair : pairs) {
        for (const Text& text : texts) {
            if (pair.onlyText != nullptr && std::string_view(pair.onlyText) != text.name) {
                continue;
            }
            const std::string source = sourceText(text, pair.from);
            for (const auto& [name, way] : ways) {
                const std::string title =
                    std::string(name) + "/" + pair.from + "_" + pair.to + "/" + text.name;
                const Way run = way;
                benchmark::RegisterBenchmark(title.c_str(), [run, &pair, source](benchmark::State& state) {
                    run(state, pair, source);
                });
            }
        }
    }
}

const bool registered = (registerAll(), true);

BENCHMARK(asciiCheck)->Name("kvt/UTF-8_US-ASCII_checked/ascii");
BENCHMARK(construct)->Name("transcoder/fixed_encodings");
BENCHMARK(constructByName)->Name("transcoder/kvt_by_name");
BENCHMARK(firstAscii)->Name("transcoder/stream_of_ascii");
BENCHMARK(firstLatin)->Name("transcoder/stream_of_latin");
BENCHMARK(openInIcu)->Name("transcoder/icu_open");
BENCHMARK(openInIconv)->Name("transcoder/iconv_open");
BENCHMARK(makeString<0>)->Name("string/utf8_to_utf8_14_bytes");
BENCHMARK(makeString<2>)->Name("string/utf8_to_utf16_14_bytes");
BENCHMARK(makeString<3>)->Name("string/utf8_to_utf32_14_bytes");

} // namespace
