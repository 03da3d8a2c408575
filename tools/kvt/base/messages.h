// The catalogue of message texts. The library names its failures by number and parameters; this is where a number
// becomes a sentence. Numbers from 920001 are the command's own, for what only the rows and cells of tables have. Placeholders are %0, %1 and so on; each may stand anywhere and more than once.
#pragma once

#include <cstdint>
#include <exception>
#include <string>
#include <string_view>
#include <vector>

namespace kvt::ex {
class Throwable;
}

namespace host {

struct Message {
    std::uint32_t number;
    const char* text;
};

/// All messages, ordered by number.
const std::vector<Message>& messages();

/// Null for a number that has no text.
const Message* findMessage(std::uint32_t number);

/// How many parameters the text takes: one more than its highest placeholder.
std::size_t parameterCount(const Message& message);

/// The text with parameters in place. A placeholder without a parameter stays, and so does a percent sign without
/// a number behind it; what stands in a parameter is not looked at again.
std::string fill(std::string_view text, const std::vector<std::string>& parameters);

/// The sentence for a number, or the number and its parameters where there is no text.
std::string describe(std::uint32_t number, const std::vector<std::string>& parameters);

/// Everything that a failure of the library says, for a line on standard error. Long parameters are cut. Of one that
/// says nothing, what kind it is.
std::string describe(const kvt::ex::Throwable& failure);

/// The same for a failure that nobody foresaw.
std::string describe(const std::exception& failure);

} // namespace host
