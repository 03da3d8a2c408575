// The texts that benchmarks work on, made from fixed seeds.
#pragma once

#include <cstddef>
#include <iterator>
#include <random>
#include <sstream>
#include <string>
#include <vector>

namespace kvt::bench {

struct Text {
    const char* name;
    const char* sentence;
};

inline constexpr Text ascii = {"ASCII",
                               "The quick brown Fox jumps over the lazy Dog, and the dog does not mind it."};
inline constexpr Text latin = {
    "Latin", "Größere Brücken führen über die Flüsse; l'été, déjà, où l'élève rêve à côté."};
inline constexpr Text japanese = {
    "Japanese",
    "いろはにほへと ちりぬるを わかよたれそ 常ならむ、 有為の奥山 今日越えて 浅き夢見じ 酔ひもせず。"};

/// Words of a sentence in a random order, since a text that repeats itself flatters whatever branches on characters.
inline std::string shuffled(const char* sentence, std::size_t bytes) {
    std::istringstream stream(sentence);
    const std::vector<std::string> words{std::istream_iterator<std::string>(stream), {}};
    std::mt19937_64 random(1);
    std::string text;
    while (text.size() < bytes) {
        text += words[random() % words.size()] + " ";
    }
    return text;
}

/// Fields of so many letters with a comma behind each.
inline std::string fields(std::size_t length, std::size_t bytes) {
    std::mt19937_64 random(1);
    std::string text;
    while (text.size() < bytes) {
        for (std::size_t i = 0; i < length; ++i) {
            text += static_cast<char>('a' + random() % 26);
        }
        text += ',';
    }
    return text;
}

/// Lines of a log, without a date and without the word "ERROR", but for one at the end.
inline std::string logText(std::size_t bytes) {
    constexpr const char* lines[] = {
        "12:03:55.120 INFO  [pool-3] request 4711 from 10.0.12.7 took 15 ms, 2048 bytes sent\n",
        "12:03:55.121 DEBUG [pool-1] cache hit for key user/77/profile, age 35 s\n",
        "12:03:56.007 WARN  [main] queue has 120 of 128 places taken\n",
        "12:03:56.450 INFO  [pool-2] session 9f3c-22 opened, 3 others active\n",
        "12:03:57.003 INFO  [pool-3] request 4712 from 10.0.12.9 took 7 ms, 512 bytes sent\n",
        "12:03:58.999 DEBUG [gc] pause of 3 ms, 512 MB of 2048 MB in use\n",
    };
    std::mt19937_64 random(1);
    std::string text;
    while (text.size() < bytes) {
        text += lines[random() % std::size(lines)];
    }
    return text + "2020-01-31 12:04:00.000 ERROR [main] disk full\n";
}

/// Sentences without digits, in which the first letters of words are frequent.
inline std::string prose(std::size_t bytes) {
    const std::string sentence = "the lazy dog and the other animals looked on, as the fox came; ";
    std::string text;
    while (text.size() < bytes) {
        text += sentence;
    }
    text.resize(bytes);
    return text;
}

} // namespace kvt::bench
