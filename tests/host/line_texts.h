// Texts of many lines for the tests of `kvt sort` and `kvt unique`, and what they have to become, the slow way.
#pragma once

#include <algorithm>
#include <cctype>
#include <cstddef>
#include <map>
#include <random>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::test {

/// The lines without their ends; the last one need not have one.
inline std::vector<std::string> linesOf(std::string_view text) {
    std::vector<std::string> lines;
    while (!text.empty()) {
        const std::size_t end = std::min(text.find('\n'), text.size());
        lines.emplace_back(text.substr(0, end));
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    return lines;
}

inline std::string textOf(const std::vector<std::string>& lines) {
    std::string text;
    for (const std::string& line : lines) {
        text.append(line).push_back('\n');
    }
    return text;
}

/// What `fold` makes of each line decides; equal ones keep their order.
template <typename Fold>
std::string sortedSlowly(std::string_view text, bool reverse, const Fold& fold) {
    std::vector<std::string> lines = linesOf(text);
    std::stable_sort(lines.begin(), lines.end(), [&](const std::string& left, const std::string& right) {
        return reverse ? fold(right) < fold(left) : fold(left) < fold(right);
    });
    return textOf(lines);
}

inline std::string sortedSlowly(std::string_view text, bool reverse = false) {
    return sortedSlowly(text, reverse, [](const std::string& line) { return line; });
}

/// The first of equal lines each, in their order, with counts where they are wanted.
template <typename Fold>
std::string uniqueSlowly(std::string_view text, bool counts, const Fold& fold) {
    std::map<std::string, std::size_t> index;
    std::vector<std::pair<std::string, int>> kept;
    for (const std::string& line : linesOf(text)) {
        const auto [found, isNew] = index.emplace(fold(line), kept.size());
        if (isNew) {
            kept.emplace_back(line, 0);
        }
        ++kept[found->second].second;
    }
    std::string out;
    for (const auto& [line, count] : kept) {
        out += (counts ? std::to_string(count) + "\t" : "") + line + "\n";
    }
    return out;
}

/// How the lines of a random text are.
struct LineShape {
    const char* name;
    std::string beginning;  ///< of every line
    std::size_t most;       ///< bytes behind that
    std::string_view bytes; ///< what they are chosen from
};

inline const std::vector<LineShape>& lineShapes() {
    using namespace std::string_view_literals;
    static const std::vector<LineShape> shapes = {
        {"words", "", 20, "abcdefghijklmnopqrstuvwxyz ABCDEFGHIJKLMNOPQRSTUVWXYZ"sv},
        {"short", "", 3, "ab"sv},
        {"nearly all alike", "https://www.example.org/a/b/c/", 4, "012"sv},
        {"alike around where prefixes end", "", 16, "a"sv},
        {"zeros and bytes of all kinds", "", 18, "\0\0\x01\x7f\x80\xff\r"sv},
        {"long", "", 2000, "xyz"sv},
    };
    return shapes;
}

inline std::string randomLines(const LineShape& shape, std::size_t size, unsigned seed) {
    std::mt19937 random(seed);
    std::string text;
    while (text.size() < size) {
        text += shape.beginning;
        for (std::size_t left = random() % (shape.most + 1); left > 0; --left) {
            text += shape.bytes[random() % shape.bytes.size()];
        }
        text += '\n';
    }
    text.pop_back();
    return text;
}

/// With small letters for all of ASCII.
inline std::string foldedAscii(std::string line) {
    for (char& c : line) {
        c = static_cast<char>(std::tolower(static_cast<unsigned char>(c)));
    }
    return line;
}

} // namespace kvt::test
