#include "messages.h"

#include "text.h"

#include <kvt/foundation/throwable.h>

#include <algorithm>

namespace host {

namespace {

bool isDigit(char character) {
    return character >= '0' && character <= '9';
}

// Calls onText for the pieces of `text` and onPlaceholder for the numbers between them, in order.
template <typename OnText, typename OnPlaceholder>
void scan(std::string_view text, const OnText& onText, const OnPlaceholder& onPlaceholder) {
    std::size_t done = 0;
    for (std::size_t index = 0; index + 1 < text.size();) {
        if (text[index] != '%' || !isDigit(text[index + 1])) {
            ++index;
            continue;
        }
        onText(text.substr(done, index - done));
        std::size_t number = 0;
        std::size_t end = index + 1;
        for (; end < text.size() && isDigit(text[end]) && end - index <= 3; ++end) {
            number = number * 10 + static_cast<std::size_t>(text[end] - '0');
        }
        onPlaceholder(number, text.substr(index, end - index));
        done = index = end;
    }
    onText(text.substr(done));
}

// A whole document may be the parameter of a failure; the beginning says enough.
std::string cut(const std::string& parameter) {
    constexpr std::size_t mostCharacters = 200;
    std::u32string text = toUtf32(parameter, kvt::ex::Encoding::Utf8);
    if (text.size() <= mostCharacters) {
        return printable(parameter);
    }
    text.resize(mostCharacters);
    return printable(text) + "...";
}

} // namespace

const std::vector<Message>& messages() {
    static const std::vector<Message> all = {
        {910002, "The bytes \"%0\" are not valid %1."},
        {910003, "The text \"%0\", read as %1, holds something that does not exist in %2."},
        {910004, "The bytes \"%0\" are binary data and cannot be taken for text."},
        {910005, "\"%0\" is not the name of an encoding that can be used here."},
    };
    return all;
}

const Message* findMessage(std::uint32_t number) {
    const auto found = std::find_if(messages().begin(), messages().end(),
                                    [&](const Message& message) { return message.number == number; });
    return found == messages().end() ? nullptr : &*found;
}

std::size_t parameterCount(const Message& message) {
    std::size_t count = 0;
    scan(
        message.text, [](std::string_view) {},
        [&](std::size_t number, std::string_view) { count = std::max(count, number + 1); });
    return count;
}

std::string fill(std::string_view text, const std::vector<std::string>& parameters) {
    std::string out;
    scan(
        text, [&](std::string_view piece) { out += piece; },
        [&](std::size_t number, std::string_view placeholder) {
            out += number < parameters.size() ? std::string_view(parameters[number]) : placeholder;
        });
    return out;
}

std::string describe(std::uint32_t number, const std::vector<std::string>& parameters) {
    if (const Message* message = findMessage(number)) {
        return fill(message->text, parameters);
    }
    std::string text = "message " + std::to_string(number);
    for (const std::string& parameter : parameters) {
        text += " \"" + parameter + "\"";
    }
    return text;
}

std::string describe(const kvt::ex::Throwable& failure) {
    std::string text;
    const auto add = [&](const std::string& sentence) { text += (text.empty() ? "" : " ") + sentence; };
    failure.processInfo([&](const kvt::ex::UString<0>& message) { add(cut(message.toStdString())); }, {}, {},
                        [&](unsigned long number, const kvt::ex::UStringArray<0>& parameters) {
                            std::vector<std::string> shown;
                            for (const kvt::ex::UString<0>& parameter : parameters) {
                                shown.push_back(cut(parameter.toStdString()));
                            }
                            add(describe(static_cast<std::uint32_t>(number), shown));
                        });
    return text.empty() ? failure.what().toStdString() : text;
}

} // namespace host
