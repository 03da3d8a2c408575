#include "base/unicode_data.h"

#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/uversion.h>

#include <array>

namespace host {

std::string characterName(char32_t character) {
    std::array<char, 256> name{};
    UErrorCode status = U_ZERO_ERROR;
    const int32_t length = u_charName(static_cast<UChar32>(character), U_EXTENDED_CHAR_NAME, name.data(),
                                      static_cast<int32_t>(name.size()), &status);
    return U_SUCCESS(status) ? std::string(name.data(), static_cast<std::size_t>(length)) : std::string();
}

bool isPrintable(char32_t character) {
    switch (u_charType(static_cast<UChar32>(character))) {
    case U_CONTROL_CHAR:
    case U_FORMAT_CHAR:
    case U_SURROGATE:
    case U_UNASSIGNED:
    case U_LINE_SEPARATOR:
    case U_PARAGRAPH_SEPARATOR:
        return false;
    default:
        return true;
    }
}

std::vector<std::string> converterNames() {
    const int32_t count = ucnv_countAvailable();
    std::vector<std::string> names;
    names.reserve(static_cast<std::size_t>(count));
    for (int32_t index = 0; index < count; ++index) {
        names.emplace_back(ucnv_getAvailableName(index));
    }
    return names;
}

bool leavesByteOrderOpen(const std::string& name) {
    UErrorCode status = U_ZERO_ERROR;
    UConverter* const converter = ucnv_open(name.c_str(), &status);
    const std::string_view canonical = U_SUCCESS(status) ? ucnv_getName(converter, &status) : "";
    const bool open = canonical == "UTF-16" || canonical == "UTF-32";
    ucnv_close(converter);
    return open;
}

std::vector<std::string> aliasesOf(const std::string& name) {
    UErrorCode status = U_ZERO_ERROR;
    const uint16_t count = ucnv_countAliases(name.c_str(), &status);
    std::vector<std::string> aliases;
    for (uint16_t index = 0; U_SUCCESS(status) && index < count; ++index) {
        const char* alias = ucnv_getAlias(name.c_str(), index, &status);
        if (U_SUCCESS(status) && alias != nullptr) {
            aliases.emplace_back(alias);
        }
    }
    return aliases;
}

std::string icuVersion() {
    UVersionInfo version;
    std::array<char, U_MAX_VERSION_STRING_LENGTH> text{};
    u_getVersion(version);
    u_versionToString(version, text.data());
    return text.data();
}

} // namespace host
