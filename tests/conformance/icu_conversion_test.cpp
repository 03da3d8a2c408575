// ICU's own cases for its converters. They steer ICU's callbacks and buffers; what kvt has of that is substitution, and
// the failure that reports one.
#include "suite.h"

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/throwable.h>
#include <kvt/string/ustring.h>

#include <gtest/gtest.h>

#include <cctype>
#include <optional>

namespace conformance {
namespace {

using kvt::ex::Encoding;
using kvt::ex::UString;

// The cells of one case: a text, with the kind of the cell in front of it where there is one ("int", "bin").
struct Cell {
    std::string kind;
    std::string value;
};

// A reader of the language of resource bundles, as far as this file makes use of it.
class Reader {
public:
    explicit Reader(std::string source) : source_(std::move(source)) {}

    void seek(const std::string& name) { at_ = source_.find(name, at_) + name.size(); }

    /// The next case of a list "{ { cell, cell } { ... } }", into which seek() has gone; nothing at its end.
    std::optional<std::vector<Cell>> next() {
        skip();
        if (source_[at_] != '{') {
            return std::nullopt;
        }
        ++at_;
        std::vector<Cell> cells;
        for (skip(); source_[at_] != '}'; skip()) {
            cells.push_back(cell());
        }
        ++at_;
        return cells;
    }

private:
    // Blanks, commas and comments.
    void skip() {
        for (;;) {
            if (source_.compare(at_, 2, "//") == 0) {
                at_ = source_.find('\n', at_);
            } else if (source_.compare(at_, 2, "/*") == 0) {
                at_ = source_.find("*/", at_) + 2;
            } else if (std::isspace(static_cast<unsigned char>(source_[at_])) != 0 || source_[at_] == ',') {
                ++at_;
            } else {
                return;
            }
        }
    }

    Cell cell() {
        Cell cell;
        if (source_[at_] == ':') {
            const std::size_t brace = source_.find('{', at_);
            cell.kind = source_.substr(at_ + 1, brace - at_ - 1);
            at_ = brace + 1;
            for (skip(); source_[at_] != '}'; skip()) {
                cell.value += source_[at_] == '"' ? text() : std::string(1, source_[at_++]);
            }
            ++at_;
        } else {
            for (; source_[at_] == '"'; skip()) {
                cell.value += text();
                // Texts that follow each other without a comma are one.
                if (source_[at_] == ',') {
                    break;
                }
            }
        }
        return cell;
    }

    // A literal, as UTF-8.
    std::string text() {
        std::u32string units;
        for (++at_; source_[at_] != '"'; ++at_) {
            if (source_[at_] != '\\') {
                units += static_cast<unsigned char>(source_[at_]);
                continue;
            }
            const char mark = source_[++at_];
            const std::size_t digits = mark == 'u' ? 4 : mark == 'U' ? 8 : mark == 'x' ? 2 : 0;
            if (digits != 0) {
                std::size_t used = 0;
                units += static_cast<char32_t>(std::stoul(source_.substr(at_ + 1, digits), &used, 16));
                at_ += used;
            } else {
                const std::string letters = "ntr";
                const std::size_t known = letters.find(mark);
                units += static_cast<unsigned char>(known == std::string::npos ? mark : "\n\t\r"[known]);
            }
        }
        ++at_;
        std::string text;
        for (std::size_t i = 0; i < units.size(); ++i) {
            const bool pair = units[i] >= 0xD800 && units[i] < 0xDC00 && i + 1 < units.size() &&
                              units[i + 1] >= 0xDC00 && units[i + 1] < 0xE000;
            text += utf8(pair ? 0x10000 + ((units[i] - 0xD800) << 10) + (units[i + 1] - 0xDC00) : units[i]);
            i += pair ? 1 : 0;
        }
        return text;
    }

    std::string source_;
    std::size_t at_ = 0;
};

std::string bytesOf(const std::string& digits) {
    std::string bytes;
    for (std::size_t at = 0; at + 1 < digits.size(); at += 2) {
        bytes += static_cast<char>(std::stoi(digits.substr(at, 2), nullptr, 16));
    }
    return bytes;
}

bool hasSurrogate(const std::string& text) {
    for (std::size_t at = 0; at + 1 < text.size(); ++at) {
        if (text[at] == '\xED' && static_cast<unsigned char>(text[at + 1]) >= 0xA0) {
            return true;
        }
    }
    return false;
}

struct Converted {
    std::string text;
    bool failed = false;
};

// By way of UTF-32, as from UTF-8 to UTF-8 nothing is looked at.
Converted decoded(Encoding encoding, const std::string& bytes) {
    Converted found;
    UString<3> characters;
    try {
        characters.assign(UString<30>({bytes.data(), bytes.size()}, encoding));
    } catch (const kvt::ex::UStringException&) {
        found.failed = true;
    }
    for (const char32_t character : characters) {
        found.text += utf8(character);
    }
    return found;
}

Converted encoded(Encoding encoding, const std::string& text) {
    Converted found;
    UString<30> bytes(encoding);
    try {
        bytes.assign(UString<0>(text.data(), text.size()).getAsUtf16());
    } catch (const kvt::ex::UStringException&) {
        found.failed = true;
    }
    found.text = bytes.toStdString();
    return found;
}

// Why a case cannot be tried; nothing when it can.
std::string reasonNot(const std::vector<Cell>& cells, const std::string& text) {
    if (cells[0].value.find('*') != std::string::npos) {
        return "converters that only ICU's own tests have";
    }
    if (Encoding(cells[0].value.substr(cells[0].value[0] == '+' ? 1 : 0), kvt::ex::nothrow) ==
        Encoding::Unknown) {
        return "converters that this ICU does not have";
    }
    if (cells[4].value != "1") {
        return "texts that go on behind the case";
    }
    if (hasSurrogate(text)) {
        return "texts with half a surrogate pair";
    }
    return "";
}

// Whether ICU's callback does what kvt does: it substitutes, and takes no character of its own for it.
bool substitutes(const std::string& callback) {
    return callback.empty() || callback == "?";
}

// Calls `use` with the cells of each case of a section that can be tried at all, and its encoding. The text stands in the
// cell `textAt`.
template <typename Use>
void forEachCase(Suite& suite, const std::string& section, std::size_t textAt, Use use) {
    Reader reader(contentsOf(sourceFolder("icu") + "/source/test/testdata/conversion.txt"));
    reader.seek(section + " {");
    reader.seek("Cases {");
    while (const auto cells = reader.next()) {
        if (const std::string reason = reasonNot(*cells, (*cells)[textAt].value); !reason.empty()) {
            suite.leaveOut(reason);
            continue;
        }
        const std::string& charset = (*cells)[0].value;
        use(*cells, Encoding(charset.substr(charset[0] == '+' ? 1 : 0)));
    }
}

TEST(ConformanceIcu, TextsAreRead) {
    if (sourceFolder("icu").empty()) {
        GTEST_SKIP() << noSources("icu");
    }
    Suite suite("ICU's cases of reading", "ICU " + sourceVersion("icu"));
    forEachCase(suite, "toUnicode", 2, [&](const auto& cells, const Encoding& encoding) {
        const std::string& charset = cells[0].value;
        const std::string& bytes = cells[1].value;
        const std::string& text = cells[2].value;
        const std::string& error = cells[6].value;
        const std::string& callback = cells[7].value;
        const Converted found = decoded(encoding, bytesOf(bytes));
        const std::string what = charset + " " + bytes + " is read as " + hex(found.text) +
                                 (found.failed ? " with a failure" : "") + ", not " + hex(text) + " " +
                                 callback;
        if (charset == "UTF-16" || charset == "UTF-32") {
            suite.leaveOut("UTF-16 and UTF-32 of no stated byte order, which is little-endian to kvt");
        } else if (!error.empty()) {
            suite.check(found.failed, what);
        } else if (found.failed && text.find('\x1A') != std::string::npos) {
            suite.leaveOut("bad bytes for which ICU's tables have U+001A, and kvt always U+FFFD");
        } else if (substitutes(callback) || !found.failed) {
            suite.check(found.text == text, what);
        } else {
            suite.leaveOut("bad text, and what another callback than the substituting one makes of it");
        }
    });
    suite.finish();
}

TEST(ConformanceIcu, TextsAreWritten) {
    if (sourceFolder("icu").empty()) {
        GTEST_SKIP() << noSources("icu");
    }
    Suite suite("ICU's cases of writing", "ICU " + sourceVersion("icu"));
    forEachCase(suite, "fromUnicode", 1, [&](const auto& cells, const Encoding& encoding) {
        const std::string& charset = cells[0].value;
        const std::string& text = cells[1].value;
        const std::string& bytes = cells[2].value;
        const std::string& error = cells[6].value;
        const std::string& callback = cells[7].value;
        const Converted found = encoded(encoding, text);
        const std::string what = charset + " " + hex(text) + " is written as " + hex(found.text) +
                                 (found.failed ? " with a failure" : "") + ", not " + bytes + " " + callback;
        if (cells[5].value != "0") {
            suite.leaveOut("bytes that ICU gives for want of better when it is asked to");
        } else if (!error.empty()) {
            suite.check(found.failed, what);
        } else if (!found.failed) {
            suite.check(found.text == bytesOf(bytes), what);
        } else {
            suite.leaveOut("characters that are not there, for which kvt has a sign of its own");
        }
    });
    suite.finish();
}

} // namespace
} // namespace conformance
