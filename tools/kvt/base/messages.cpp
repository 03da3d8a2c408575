#include "base/messages.h"

#include "base/text.h"
#include "base/text_units.h"

#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <cstdlib>
#include <cxxabi.h>
#include <memory>
#include <typeinfo>

namespace host {

namespace {

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

// The name of a class as it is written in C++.
std::string kindOf(const std::type_info& type) {
    int status = 0;
    const std::unique_ptr<char, void (*)(void*)> name(
        abi::__cxa_demangle(type.name(), nullptr, nullptr, &status), std::free);
    return status == 0 ? name.get() : type.name();
}

} // namespace

const std::vector<Message>& messages() {
    static const std::vector<Message> all = {
        {910002, "The bytes \"%0\" are not valid %1."},
        {910003, "The text \"%0\", read as %1, holds something that does not exist in %2."},
        {910004, "The bytes \"%0\" are binary data and cannot be taken for text."},
        {910005, "\"%0\" is not the name of an encoding that can be used here."},
        {920001, "The quote that opens here is never closed."},
        {920002, "There is text behind the closing quote."},
        {920003, "The row has a byte of zero."},
        {920004, "The row has %0, but the table has %1."},
        {920005, "\"%0\" is not a number as it is written in %1."},
        {920006, "\"%0\" gives %1, but there are columns for %2."},
        {920007, "The regular expression takes too long on \"%0\"."},
        {933050, "The zone of this machine cannot be found: %0"},
        {933052, "A value of the kind %0 cannot become one of the kind %1."},
        {933059, "\"%0\" and \"%1\" are not of kinds that can be compared."},
        {933060,
         "\"%0\" is a time of day, and \"%1\" has years, months or days, which cannot be added to it."},
        {933063, "\"%0\" is no date, time or datetime in canonical form."},
        {933064, "\"%0\" is no interval, whose form is [-]P[nY][nM][nD][T[nH][nM][nS]]."},
        {933065, "%0 is out of range for the %1, which goes from %2 to %3."},
        {933067, "The value fits the format up to \"%0\" but not where the format goes on with \"%1\"."},
        {933068, "It failed for a reason that has no message of its own."},
        {933071, "\"%0\" has no offset from UTC."},
        {933073, "\"%0\" has no offset from UTC to convert from."},
        {933074, "The format is empty."},
        {933075,
         "\"%0\" holds neither a known keyword, which are ZQT and ISO, nor a flag, which begins with \"%\"."},
        {933076, "The format ends in a single \"%\"."},
        {933078, "The format asks by \"%0\" for what a value of the kind %1 does not have."},
        {933079, "\"%0\" is no flag that %1 knows."},
        {933081, "The format \"%0\" has a day of the year but no year."},
        {933082, "By the format \"%0\", the value gives no whole date."},
        {933083, "The flags \"%0\" and \"%1\" exclude each other in one format."},
        {933084, "The value could not be written, for a reason that has no message of its own."},
        {933085, "The format \"%0\" has an offset from UTC but no time."},
        {933086, "By the format \"%0\", the value gives no whole time."},
        {933087, "By the format \"%0\", the value gives neither a date nor a time."},
        {933088,
         "By the format \"%0\", the value is before or after noon, but its hour is not one from 1 to 12."},
        {933089, "By the format \"%0\", the value is a day of the year that this year does not have."},
        {933090, "By the format \"%0\", the value is a day that the calendar does not have."},
        {933091, "By the format \"%0\", the year of the result is not one from 1000 to 9999."},
        {933092, "There is no zone: it is empty."},
        {933093, "\"%0\", in seconds since 1970, is not within the years 1000 to 9999."},
        {933094, "Where this machine is, \"%0\" is on no clock: they were put forward past it."},
        {933095, "Where this machine is, \"%0\" is on the clocks twice: they were put back across it."},
        {933096, "\"%0\" has no date, and without one the offset of this machine's zone is not known."},
        {933097, "\"%0\" is in none of the forms that the format names."},
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
    return text.empty() ? "a failure of the kind " + kindOf(typeid(failure)) + " without a message" : text;
}

std::string describe(const std::exception& failure) {
    return "an unforeseen failure of the kind " + kindOf(typeid(failure)) + ": " + printable(failure.what());
}

} // namespace host
