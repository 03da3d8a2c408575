// What a call threw, flattened to plain text so that a test compares all of it at once and prints what
// differs.
//
//     EXPECT_EQ(failureOf([&] { UString<1>("\xC3\xA9"); }),
//               transcodingFailure("\u00e9", "UTF-8", "US-ASCII", "\x1A", "\x1A"));
#pragma once

#include <kvt/foundation/throwable.h>

#include <cstdint>
#include <cstdio>
#include <exception>
#include <ostream>
#include <stdexcept>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace kvt::test {

/// Control bytes and bytes from 128 up as \xHH, as failures show them.
inline std::string printable(std::string_view bytes) {
    std::string text;
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        char hex[8];
        std::snprintf(hex, sizeof hex, "\\x%02X", static_cast<unsigned>(byte));
        text += byte < 32 || byte > 127 ? std::string(hex) : std::string(1, c);
    }
    return text;
}

struct FailureRecord {
    std::string type; ///< the class, empty when nothing was thrown
    std::uint64_t number = 0;
    std::vector<std::string> parameters;
    std::vector<std::pair<std::string, std::string>> pairs;
    std::string text; ///< plain strings of a Throwable; what() of a standard exception

    friend bool operator==(const FailureRecord&, const FailureRecord&) = default;
    friend std::ostream& operator<<(std::ostream& stream, const FailureRecord& record) {
        if (record.type.empty()) {
            return stream << "no failure";
        }
        stream << record.type << ' ' << record.number;
        for (const std::string& parameter : record.parameters) {
            stream << " [" << printable(parameter) << ']';
        }
        for (const auto& [name, value] : record.pairs) {
            stream << ' ' << name << "=[" << printable(value) << ']';
        }
        return stream << (record.text.empty() ? "" : " text: ") << record.text;
    }
};

inline FailureRecord recordOf(const kvt::ex::Throwable& failure) {
    using kvt::ex::UString;
    FailureRecord record;
    record.type = failure.className().toStdString();
    failure.processInfo([&](const UString<0>& message) { record.text += message.toStdString(); },
                        [&](const UString<0>&, const UString<0>&, int) { record.text += "(a stack frame)"; },
                        [&](const UString<0>& name, const UString<0>& value) {
                            record.pairs.emplace_back(name.toStdString(), value.toStdString());
                        },
                        [&](unsigned long number, const kvt::ex::UStringArray<0>& parameters) {
                            record.number = number;
                            for (const UString<0>& parameter : parameters) {
                                record.parameters.push_back(parameter.toStdString());
                            }
                        });
    return record;
}

/// Runs `action` and records what it throws.
template <typename Action>
FailureRecord failureOf(Action&& action) {
    FailureRecord record;
    try {
        action();
    } catch (const kvt::ex::Throwable& failure) {
        record = recordOf(failure);
    } catch (const std::invalid_argument& failure) {
        record.type = "std::invalid_argument";
        record.text = failure.what();
    } catch (const std::exception& failure) {
        record.type = "std::exception";
        record.text = failure.what();
    }
    return record;
}

inline FailureRecord noFailure() {
    return {};
}

inline FailureRecord badEncodingFailure(std::string_view bytes, std::string_view from, std::string_view lossy,
                                        std::string_view substitution) {
    return {"kvt::ex::UStringBadEncodingException",
            910002,
            {printable(bytes), std::string(from)},
            {{"substituted_conversion", std::string(lossy)},
             {"substitution_characters", std::string(substitution)}},
            ""};
}

inline FailureRecord transcodingFailure(std::string_view text, std::string_view from, std::string_view to,
                                        std::string_view lossy, std::string_view substitution) {
    return {"kvt::ex::UStringTranscodingException",
            910003,
            {std::string(text), std::string(from), std::string(to)},
            {{"substituted_conversion", std::string(lossy)},
             {"substitution_characters", std::string(substitution)}},
            ""};
}

inline FailureRecord binaryFailure(std::string_view bytes) {
    return {"kvt::ex::UStringBinaryTranscodingException", 910004, {printable(bytes)}, {}, ""};
}

inline FailureRecord invalidEncodingFailure(std::string_view name) {
    return {"kvt::ex::InvalidEncodingException", 910005, {std::string(name)}, {}, ""};
}

inline FailureRecord notImplementedFailure(std::string_view function) {
    return {"kvt::ex::UStringNotImplementedException",
            0,
            {},
            {},
            "The function " + std::string(function) + " is not implemented."};
}

inline FailureRecord invalidArgument(std::string_view text) {
    return {"std::invalid_argument", 0, {}, {}, std::string(text)};
}

} // namespace kvt::test
