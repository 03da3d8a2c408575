// How many times as fast as the plain design conversion has to be: a loop over ucnv_convertEx with a pivot of 1024 units
// and chunks of 4096, one result string made afresh for each call. The C library's iconv and, where there is one, ICU's
// own call for the pair are shown beside it.
#include "limits.h"

#include <kvt/kvt.h>

#include <unicode/ucnv.h>
#include <unicode/ustring.h>

#include <iconv.h>

#include <cerrno>
#include <memory>
#include <random>
#include <sstream>
#include <stdexcept>

namespace {

using namespace kvt::ex;
using kvt::bench::Bound;
using kvt::bench::Limits;
using kvt::bench::way;

constexpr std::size_t textBytes = 1 << 20;

/// Words of a sentence in a random order, since a text that repeats itself flatters whatever branches on characters.
std::string shuffled(const char* sentence, std::size_t bytes) {
    std::istringstream stream(sentence);
    std::vector<std::string> words;
    for (std::string word; stream >> word;) {
        words.push_back(word + " ");
    }
    std::mt19937_64 random(1);
    std::string text;
    while (text.size() < bytes) {
        text += words[random() % words.size()];
    }
    return text;
}

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

struct Text {
    const char* name;
    const char* sentence;
};

struct Held {
    const char* from;
    const char* to;
    Text text;
    double limit;
};

constexpr Text ascii{"ASCII", "The quick brown fox jumps over the lazy dog, and the dog does not mind it. "};
constexpr Text latin{"Latin",
                     "Größere Brücken führen über die Flüsse; l'été, déjà, où l'élève rêve à côté. "};
constexpr Text japanese{
    "Japanese",
    "いろはにほへと ちりぬるを わかよたれそ 常ならむ、 有為の奥山 今日越えて 浅き夢見じ 酔ひもせず。"};
constexpr Text simplified{"Chinese",
                          "春眠不觉晓， 处处闻啼鸟。 夜来风雨声， 花落知多少。 白日依山尽， 黄河入海流。"};
constexpr Text traditional{"Chinese",
                           "春眠不覺曉， 處處聞啼鳥。 夜來風雨聲， 花落知多少。 白日依山盡， 黃河入海流。"};
constexpr Text korean{"Korean", "동해물과 백두산이 마르고 닳도록 하느님이 보우하사 우리나라 만세. "
                                "무궁화 삼천리 화려 강산 대한 사람 대한으로 길이 보전하세."};

// In the order of what is promised: the pair, and what it has to reach for each text.
constexpr Held held[] = {
    {"UTF-8", "UTF-16LE", ascii, 16},      {"UTF-8", "UTF-16LE", latin, 7.5},
    {"UTF-8", "UTF-16LE", japanese, 5.5},  {"UTF-16LE", "UTF-8", ascii, 10},
    {"UTF-16LE", "UTF-8", latin, 3},       {"UTF-16LE", "UTF-8", japanese, 3},
    {"UTF-8", "UTF-32LE", ascii, 12},      {"UTF-8", "UTF-32LE", latin, 6.3},
    {"UTF-8", "UTF-32LE", japanese, 8.4},  {"windows-1252", "UTF-8", ascii, 11},
    {"windows-1252", "UTF-8", latin, 3.4}, {"UTF-8", "windows-1252", ascii, 14},
    {"UTF-8", "windows-1252", latin, 2.2}, {"Shift_JIS", "UTF-8", japanese, 3.2},
    {"UTF-8", "Shift_JIS", japanese, 1.7}, {"EUC-JP", "UTF-8", japanese, 3.2},
    {"UTF-8", "EUC-JP", japanese, 1.7},    {"GBK", "UTF-8", simplified, 3.2},
    {"UTF-8", "GBK", simplified, 1.7},     {"GB18030", "UTF-8", simplified, 3.2},
    {"UTF-8", "GB18030", simplified, 1.7}, {"Big5", "UTF-8", traditional, 3.2},
    {"UTF-8", "Big5", traditional, 1.7},   {"EUC-KR", "UTF-8", korean, 3.2},
    {"UTF-8", "EUC-KR", korean, 1.7},
};

/// The library's own call for a pair of Unicode forms, with the string types, and for the others by an encoding.
kvt::bench::Way libraryWay(const Held& row, const std::string& text) {
    const std::string from = row.from;
    const std::string to = row.to;
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

void holdConversions(Limits& limits, std::size_t bytes, const std::string& size, Bound bound) {
    for (const Held& row : held) {
        const Converter utf8("UTF-8");
        const Converter from(row.from);
        const Converter to(row.to);
        const std::string text = convertPlainly(from, utf8, shuffled(row.text.sentence, bytes));
        const std::string name = std::string(row.from) + " to " + row.to + ", " + row.text.name + ", " + size;
        limits.add(name, libraryWay(row, text));
        limits.add(name + ": plain", way([to, from, text] { return convertPlainly(to, from, text); }));
        limits.add(name + ": iconv",
                   way([iconv = Iconv(row.to, row.from), text] { return iconv.convert(text); }));
        limits.add(name + ": copy", way([text] { return std::string(text); }));
        limits.hold({name, name + ": plain", bound, row.limit});
        limits.hold({name, name + ": iconv", bound, 1});
        limits.hold({name, name + ": copy"});
    }
}

} // namespace

int main(int argc, char** argv) {
    Limits large(31, 1);
    holdConversions(large, textBytes, "1 MiB", Bound::atLeast);
    Limits small(101, 2000);
    holdConversions(small, 64, "64 bytes", Bound::shown);
    holdConversions(small, 16, "16 bytes", Bound::shown);
    const bool isLargeWithin = large.run(argc, argv) == 0;
    return small.run(argc, argv) == 0 && isLargeWithin ? 0 : 1;
}
