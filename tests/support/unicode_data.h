// Reads the files of the Unicode Character Database, which Debian's package unicode-data brings.
#pragma once

#include <cstdint>
#include <fstream>
#include <sstream>
#include <stdexcept>
#include <string>
#include <vector>

namespace kvt::test {

/// The characters of a field such as "0061 02BE".
inline std::u32string codePoints(const std::string& field) {
    std::u32string text;
    std::istringstream words(field);
    for (std::uint32_t value = 0; words >> std::hex >> value;) {
        text += static_cast<char32_t>(value);
    }
    return text;
}

/// The fields of each line, without blanks in front and comments.
inline std::vector<std::vector<std::string>> unicodeRows(const std::string& name) {
    std::ifstream file(KVT_UNICODE_DATA_DIR "/" + name);
    if (!file) {
        throw std::runtime_error("cannot read " KVT_UNICODE_DATA_DIR "/" + name +
                                 ", which Debian's package unicode-data brings");
    }
    std::vector<std::vector<std::string>> rows;
    for (std::string line; std::getline(file, line);) {
        std::vector<std::string> fields;
        std::istringstream rest(line.substr(0, line.find('#')));
        for (std::string field; std::getline(rest, field, ';');) {
            const std::size_t first = field.find_first_not_of(' ');
            fields.push_back(first == std::string::npos ? "" : field.substr(first));
        }
        if (fields.size() > 1) {
            rows.push_back(fields);
        }
    }
    return rows;
}

} // namespace kvt::test
