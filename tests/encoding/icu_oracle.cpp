#include <encoding/icu_oracle.h>

#include <unicode/ucnv.h>

#include <cstdint>
#include <memory>
#include <set>

namespace kvt::test {
namespace {

using Converter = std::unique_ptr<UConverter, decltype(&ucnv_close)>;

Converter open(const std::string& name) {
    UErrorCode error = U_ZERO_ERROR;
    return {ucnv_open(name.c_str(), &error), &ucnv_close};
}

const char* standardName(const char* name, const char* standard) {
    UErrorCode error = U_ZERO_ERROR;
    return ucnv_getStandardName(name, standard, &error);
}

} // namespace

const std::vector<std::string>& icuConverters() {
    static const std::vector<std::string> converters = [] {
        std::vector<std::string> names;
        for (std::int32_t i = 0; i < ucnv_countAvailable(); ++i) {
            names.emplace_back(ucnv_getAvailableName(i));
        }
        return names;
    }();
    return converters;
}

const std::vector<std::string>& icuAliases() {
    static const std::vector<std::string> aliases = [] {
        std::vector<std::string> names;
        std::set<std::string> seen;
        for (const std::string& converter : icuConverters()) {
            UErrorCode error = U_ZERO_ERROR;
            const std::uint16_t count = ucnv_countAliases(converter.c_str(), &error);
            for (std::uint16_t i = 0; i < count; ++i) {
                error = U_ZERO_ERROR;
                const char* const alias = ucnv_getAlias(converter.c_str(), i, &error);
                if (alias != nullptr && seen.insert(alias).second) {
                    names.emplace_back(alias);
                }
            }
        }
        return names;
    }();
    return aliases;
}

std::string canonicalName(const std::string& name) {
    const Converter converter = open(name);
    if (converter == nullptr) {
        return {};
    }
    UErrorCode error = U_ZERO_ERROR;
    const char* const own = ucnv_getName(converter.get(), &error);
    const char* best = standardName(own, "MIME");
    if (best == nullptr) {
        best = standardName(own, "IANA");
    }
    const std::string result = best != nullptr ? best : own;
    return result == "UTF-16" ? "UTF-16LE" : result == "UTF-32" ? "UTF-32LE" : result;
}

bool hasOneByteCharacters(const std::string& name) {
    const Converter converter = open(name);
    return converter != nullptr && ucnv_getMaxCharSize(converter.get()) == 1;
}

} // namespace kvt::test
