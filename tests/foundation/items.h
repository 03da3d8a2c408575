// The list of a failure as texts that a test can compare.
#pragma once

#include <kvt/foundation/throwable.h>

#include <string>
#include <vector>

namespace kvt::test {

/// One text for each item: `string TEXT`, `frame FILE|FUNCTION|LINE`, `pair NAME|VALUE`, `message NUMBER|%0|%1...`.
inline std::vector<std::string> itemsOf(const kvt::ex::Throwable& failure) {
    using kvt::ex::UString;
    std::vector<std::string> items;
    failure.processInfo(
        [&](const UString<0>& message) { items.push_back("string " + message.toStdString()); },
        [&](const UString<0>& file, const UString<0>& function, int line) {
            items.push_back("frame " + file.toStdString() + "|" + function.toStdString() + "|" +
                            std::to_string(line));
        },
        [&](const UString<0>& name, const UString<0>& value) {
            items.push_back("pair " + name.toStdString() + "|" + value.toStdString());
        },
        [&](unsigned long number, const kvt::ex::UStringArray<0>& parameters) {
            std::string text = "message " + std::to_string(number);
            for (const UString<0>& parameter : parameters) {
                text += "|" + parameter.toStdString();
            }
            items.push_back(text);
        });
    return items;
}

using Items = std::vector<std::string>;

} // namespace kvt::test
