#include "convert/loss_report.h"

#include "base/text.h"
#include "base/unicode_data.h"

#include <nlohmann/json.hpp>

namespace host {

namespace {

bool isBadInput(const kvt::ex::Loss& loss) {
    return loss.kind == kvt::ex::Loss::BadInput;
}

} // namespace

std::string describeLost(const kvt::ex::Loss& loss) {
    if (isBadInput(loss)) {
        return "bad bytes " + hexBytes(loss.bytes);
    }
    std::string text = codePointName(loss.codePoint) + " " + characterName(loss.codePoint);
    if (isPrintable(loss.codePoint)) {
        text += " \"" + printable(std::u32string_view(&loss.codePoint, 1)) + "\"";
    }
    return text + " (" + hexBytes(loss.bytes) + ")";
}

std::string escapedBytes(std::string_view bytes) {
    std::string text;
    for (const char byte : bytes) {
        text += byte >= 32 && byte < 127 ? std::string(1, byte) : "\\x" + hexBytes({&byte, 1});
    }
    return text;
}

std::string describeLoss(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                         const std::string& to) {
    return describe(place) + ": " + describeLost(loss) +
           (isBadInput(loss) ? " are not valid " + from : " is not in " + to);
}

std::string describeWritten(const std::optional<std::u32string>& written) {
    return written ? ", written as \"" + printable(*written) + "\"" : "";
}

std::string lossAsJson(const kvt::ex::Loss& loss, const Place& place, const std::string& from,
                       const std::string& to, const std::optional<std::u32string>& written) {
    nlohmann::ordered_json object;
    object["file"] = place.file;
    object["offset"] = place.offset;
    object["line"] = place.line;
    object["column"] = place.column;
    object["kind"] = isBadInput(loss) ? "bad-input" : "not-representable";
    object["bytes"] = hexBytes(loss.bytes);
    object["codePoint"] = nullptr;
    object["name"] = nullptr;
    if (!isBadInput(loss)) {
        object["codePoint"] = codePointName(loss.codePoint);
        object["name"] = characterName(loss.codePoint);
    }
    object["from"] = from;
    object["to"] = to;
    if (written) {
        object["replacement"] = toUtf8(*written);
    }
    return object.dump() + "\n";
}

} // namespace host
