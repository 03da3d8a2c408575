// How many times as fast as the plain design conversion has to be: a loop over ucnv_convertEx with a pivot of 1024
// units and chunks of 4096, one result string made afresh for each call. The C library's iconv is held beside it.
// Behind that come texts with losses, wwjd, strings of 14 bytes, and the registry of encodings on two threads.
#include "limits.h"
#include "texts.h"

#include <kvt/kvt.h>

#include <unicode/ucnv.h>
#include <unicode/ustring.h>

#include <iconv.h>

#include <cerrno>
#include <memory>
#include <random>
#include <stdexcept>
#include <thread>

namespace {

using namespace kvt::ex;
using kvt::bench::ascii;
using kvt::bench::Bound;
using kvt::bench::japanese;
using kvt::bench::latin;
using kvt::bench::Limits;
using kvt::bench::shuffled;
using kvt::bench::Text;
using kvt::bench::way;

constexpr std::size_t textBytes = 1 << 20;

class Converter {
public:
    explicit Converter(const char* name) {
        UErrorCode error = U_ZERO_ERROR;
        converter_.reset(ucnv_open(name, &error), &ucnv_close);
        if (U_FAILURE(error)) {
            throw std::runtime_error(name);
        }
    }
    UConverter* get() const { return converter_.get(); }

private:
    std::shared_ptr<UConverter> converter_;
};

std::string convertPlainly(const Converter& to, const Converter& from, const std::string& text) {
    std::string out;
    char chunk[4096];
    char16_t pivot[1024];
    char16_t* pivotSource = pivot;
    char16_t* pivotTarget = pivot;
    const char* source = text.data();
    UErrorCode error = U_BUFFER_OVERFLOW_ERROR;
    for (bool reset = true; error == U_BUFFER_OVERFLOW_ERROR; reset = false) {
        char* target = chunk;
        error = U_ZERO_ERROR;
        ucnv_convertEx(to.get(), from.get(), &target, chunk + sizeof chunk, &source,
                       text.data() + text.size(), pivot, &pivotSource, &pivotTarget, pivot + 1024,
                       reset ? 1 : 0, 1, &error);
        out.append(chunk, static_cast<std::size_t>(target - chunk));
    }
    return out;
}

class Iconv {
public:
    Iconv(const char* to, const char* from) : descriptor_(iconv_open(to, from), &close) {
        if (descriptor_.get() == reinterpret_cast<void*>(-1)) {
            throw std::runtime_error(std::string("iconv: ") + to);
        }
    }
    std::string convert(const std::string& text) const {
        std::string out(text.size() * 4, '\0');
        char* source = const_cast<char*>(text.data());
        std::size_t left = text.size();
        char* target = out.data();
        std::size_t room = out.size();
        iconv(descriptor_.get(), &source, &left, &target, &room);
        out.resize(out.size() - room);
        return out;
    }

private:
    static void close(void* descriptor) { iconv_close(descriptor); }
    std::shared_ptr<void> descriptor_;
};

struct Pair {
    const char* from;
    const char* to;
    Text text;
    double limit;
    double limitBack; ///< 0 where the way back is not held
};

constexpr Text simplified{"Chinese",
                          "春眠不觉晓， 处处闻啼鸟。 夜来风雨声， 花落知多少。 白日依山尽， 黄河入海流。"};
constexpr Text traditional{"Chinese",
                           "春眠不覺曉， 處處聞啼鳥。 夜來風雨聲， 花落知多少。 白日依山盡， 黃河入海流。"};
constexpr Text korean{"Korean", "동해물과 백두산이 마르고 닳도록 하느님이 보우하사 우리나라 만세. "
                                "무궁화 삼천리 화려 강산 대한 사람 대한으로 길이 보전하세."};

// The pair, and what it has to reach for a text, there and back.
constexpr Pair pairs[] = {
    {"UTF-8", "UTF-16LE", ascii, 16, 10},       {"UTF-8", "UTF-16LE", latin, 7.5, 3},
    {"UTF-8", "UTF-16LE", japanese, 5.5, 3},    {"UTF-8", "UTF-32LE", ascii, 12, 0},
    {"UTF-8", "UTF-32LE", latin, 6.3, 0},       {"UTF-8", "UTF-32LE", japanese, 8.4, 0},
    {"windows-1252", "UTF-8", ascii, 11, 14},   {"windows-1252", "UTF-8", latin, 3.4, 2.2},
    {"Shift_JIS", "UTF-8", japanese, 3.2, 1.7}, {"EUC-JP", "UTF-8", japanese, 3.2, 1.7},
    {"GBK", "UTF-8", simplified, 3.2, 1.7},     {"GB18030", "UTF-8", simplified, 3.2, 1.7},
    {"Big5", "UTF-8", traditional, 3.2, 1.7},   {"EUC-KR", "UTF-8", korean, 3.2, 1.7},
};

/// The library's own call for a pair of Unicode forms, with the string types, and for the others by an encoding.
kvt::bench::Way libraryWay(const std::string& from, const std::string& to, const std::string& text) {
    if (from == "UTF-8" && to == "UTF-16LE") {
        return way([source = UString<0>(text.data(), text.size())] { return UString<2>(source); });
    }
    if (from == "UTF-8" && to == "UTF-32LE") {
        return way([source = UString<0>(text.data(), text.size())] { return UString<3>(source); });
    }
    if (from == "UTF-16LE") {
        return way([source = UString<2>(text.data(), text.size(), Encoding::Utf16LE)] {
            return UString<0>(source);
        });
    }
    if (to == "UTF-8") {
        return way(
            [source = UString<30>(text.data(), text.size(), Encoding(from))] { return UString<0>(source); });
    }
    return way([source = UString<0>(text.data(), text.size()), encoding = Encoding(to)] {
        return source.getAsEncoding(encoding);
    });
}

void holdConversion(Limits& limits, const char* fromName, const char* toName, const Text& sample,
                    std::size_t bytes, const std::string& size, kvt::bench::Bound besideIconv, double limit) {
    const Converter utf8("UTF-8");
    const Converter from(fromName);
    const Converter to(toName);
    // A long text first, which has the library build what tables there are for the pair.
    libraryWay(fromName, toName, convertPlainly(from, utf8, shuffled(sample.sentence, textBytes)))(1);
    const std::string text = convertPlainly(from, utf8, shuffled(sample.sentence, bytes));
    const std::string name = std::string(fromName) + " to " + toName + ", " + sample.name + ", " + size;
    limits.add(name, libraryWay(fromName, toName, text));
    limits.add(name + ": plain", way([to, from, text] { return convertPlainly(to, from, text); }));
    limits.add(name + ": iconv",
               way([iconv = Iconv(toName, fromName), text] { return iconv.convert(text); }));
    limits.add(name + ": copy", way([text] { return std::string(text); }));
    limits.hold({name, name + ": plain", Bound::atLeast, limit});
    limits.hold({name, name + ": iconv", besideIconv, 1});
    limits.hold({name, name + ": copy"});
}

/// What a text of `bytes` has to reach: the limit of its row, or one for all rows.
void holdConversions(Limits& limits, std::size_t bytes, const std::string& size, double limitForAll) {
    const Bound besideIconv = limitForAll != 0 ? Bound::shown : Bound::atLeast;
    for (const Pair& pair : pairs) {
        const double limit = limitForAll != 0 ? limitForAll : pair.limit;
        const double limitBack = limitForAll != 0 ? limitForAll : pair.limitBack;
        holdConversion(limits, pair.from, pair.to, pair.text, bytes, size, besideIconv, limit);
        if (pair.limitBack != 0) {
            holdConversion(limits, pair.to, pair.from, pair.text, bytes, size, besideIconv, limitBack);
        }
    }
}

std::size_t lossesOfStream(Encoding to, const std::string& text) {
    std::string out;
    std::size_t losses = 0;
    const auto onLoss = [&](const Loss&) { ++losses; };
    StreamTranscoder stream(Encoding::Utf8, to);
    stream.convert(text, out, onLoss);
    stream.finish(out, onLoss);
    return losses;
}

/// Bad input, told by the stream with its place.
void holdBadInput(Limits& limits) {
    const std::pair<const char*, const char*> rows[] = {
        {"one byte in twenty", "abcdefghijklmnopqrs\xFF"},
        {"letters of windows-1252", "Gr\xF6\xDF"
                                    "e f\xFChren \xFC"
                                    "ber l\xE9"},
    };
    for (const auto& [what, piece] : rows) {
        std::string text;
        while (text.size() < textBytes / 4) {
            text += piece;
        }
        const std::string name = std::string("UTF-8 to UTF-16LE, bad input, ") + what;
        limits.add(name, way([text] { return lossesOfStream(Encoding::Utf16LE, text); }));
        limits.add(name + ": plain", way([to = Converter("UTF-16LE"), from = Converter("UTF-8"), text] {
                       return convertPlainly(to, from, text);
                   }));
        limits.hold({name, name + ": plain", Bound::atMost, 2});
    }
}

/// One character in twenty is lost.
void holdLosses(Limits& limits) {
    struct Lossy {
        const char* to;
        const char* good; ///< nineteen characters
        const char* lost;
    };
    constexpr Lossy rows[] = {
        {"ISO-8859-1", "abcdefghijklmnopqrs", "日"},
        {"windows-1252", "Größe führen über l", "日"},
        {"Shift_JIS", "いろはにほへとちりぬるをわかよたれそ", "é"},
    };
    for (const Lossy& row : rows) {
        std::string text;
        while (text.size() < textBytes / 4) {
            text.append(row.good).append(row.lost);
        }
        const Encoding to{kvt::future::string_view(row.to)};
        const std::string name = std::string("UTF-8 to ") + row.to + " with losses, ";
        limits.add(name + "failure", way([to, text] {
                       std::string out;
                       try {
                           ICUTranscoder(Encoding::Utf8, to).transcode<char, char>(text, out);
                       } catch (const UStringTranscodingException& failure) {
                           return failure.getLossyConversion().size();
                       }
                       return out.size();
                   }));
        limits.add(name + "stream", way([to, text] { return lossesOfStream(to, text); }));
        limits.add(name + "plain", way([to = Converter(row.to), from = Converter("UTF-8"), text] {
                       return convertPlainly(to, from, text);
                   }));
        limits.hold({name + "failure", name + "plain", Bound::atMost, 2});
        limits.hold({name + "stream", name + "plain", Bound::atMost, 2});
    }
}

void holdWwjd(Limits& limits) {
    const std::string text = shuffled(ascii.sentence, textBytes / 4);
    const UString<2> wide{UString<0>(text)};
    const std::string tokens = detail::utf16ToWwjd({wide.rawData(), wide.size()});
    limits.add("wwjdEncode", way([wide] { return detail::utf16ToWwjd({wide.rawData(), wide.size()}); }));
    limits.add("wwjdDecode", way([tokens] {
                   const char* data = nullptr;
                   std::uint64_t size = 0;
                   detail::wwjdDecode<char>(kvt::future::string_view(tokens), data, size);
                   return size;
               }));
    limits.hold({"wwjdDecode", "wwjdEncode", Bound::atMost, 2});
}

template <std::uint32_t To, std::uint32_t From>
void holdPair(Limits& limits, const char* name) {
    const UString<From> text{UString<0>("fourteen bytes")};
    limits.add(name, way([text] { return UString<To>(text); }));
    limits.hold({name, "copy of UString<0>, 14 bytes", Bound::atMost, 25.0 / 9});
}

void holdShortPairs(Limits& limits) {
    limits.add("copy of UString<0>, 14 bytes",
               way([text = UString<0>("fourteen bytes")] { return UString<0>(text); }));
    holdPair<2, 0>(limits, "UString<2>(UString<0>), 14 bytes");
    holdPair<3, 0>(limits, "UString<3>(UString<0>), 14 bytes");
    holdPair<0, 2>(limits, "UString<0>(UString<2>), 14 bytes");
    holdPair<3, 2>(limits, "UString<3>(UString<2>), 14 bytes");
    holdPair<0, 3>(limits, "UString<0>(UString<3>), 14 bytes");
    holdPair<2, 3>(limits, "UString<2>(UString<3>), 14 bytes");
}

/// Two threads do 1.8 times the work of one.
template <typename Work>
void holdScaling(Limits& limits, const std::string& name, Work work) {
    const auto one = [work](int calls) {
        for (int i = 0; i < calls; ++i) {
            auto result = work();
            benchmark::DoNotOptimize(&result);
        }
    };
    limits.add(name + ", one thread", one);
    limits.add(name + ", two threads", [one](int calls) {
        std::thread other(one, calls);
        one(calls);
        other.join();
    });
    limits.hold({name + ", two threads", name + ", one thread", Bound::atMost, 2 / 1.8});
}

} // namespace

int main(int argc, char** argv) {
    Limits large(9, 8);
    holdConversions(large, textBytes, "1 MiB", 0);
    holdLosses(large);
    holdBadInput(large);
    holdWwjd(large);
    Limits small(101, 2000);
    holdConversions(small, 64, "64 bytes", 4);
    holdConversions(small, 16, "16 bytes", 3);
    holdShortPairs(small);
    Limits threads(15, 1000000);
    holdScaling(threads, "getName", [encoding = Encoding("KOI8-R")] { return encoding.getName(); });
    holdScaling(threads, "Encoding(name)", [] { return Encoding("KOI8-R"); });
    bool areAllWithin = true;
    for (Limits* const limits : {&large, &small, &threads}) {
        areAllWithin = limits->run(argc, argv) == 0 && areAllWithin;
    }
    return areAllWithin ? 0 : 1;
}
