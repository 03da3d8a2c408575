#include "translate/icu_data.h"

#include "base/text.h"

#include <unicode/uchar.h>
#include <unicode/ucnv.h>
#include <unicode/unorm2.h>
#include <unicode/ures.h>
#include <unicode/ustring.h>

#include <algorithm>
#include <initializer_list>

namespace host {

namespace {

std::string utf8Of(const UChar* text, int32_t length) {
    std::string out(static_cast<std::size_t>(length) * 3, '\0');
    int32_t written = 0;
    UErrorCode status = U_ZERO_ERROR;
    u_strToUTF8(out.data(), static_cast<int32_t>(out.size()), &written, text, length, &status);
    out.resize(U_SUCCESS(status) ? static_cast<std::size_t>(written) : 0);
    return out;
}

std::u16string utf16Of(std::string_view utf8) {
    std::u16string out(utf8.size(), u'\0');
    int32_t written = 0;
    UErrorCode status = U_ZERO_ERROR;
    u_strFromUTF8(out.data(), static_cast<int32_t>(out.size()), &written, utf8.data(),
                  static_cast<int32_t>(utf8.size()), &status);
    out.resize(U_SUCCESS(status) ? static_cast<std::size_t>(written) : 0);
    return out;
}

// ICU's data is a tree of named nodes; what a country does not have of its own stands with its language.
class LanguageData {
public:
    using Node = std::unique_ptr<UResourceBundle, decltype(&ures_close)>;

    static std::optional<LanguageData> open(std::string language) {
        std::replace(language.begin(), language.end(), '-', '_');
        UErrorCode status = U_ZERO_ERROR;
        Node root(ures_open(nullptr, language.c_str(), &status), ures_close);
        if (U_FAILURE(status) || status == U_USING_DEFAULT_WARNING || language.empty()) {
            return std::nullopt;
        }
        return LanguageData(std::move(root), language);
    }

    /// Null where there is none.
    Node find(std::initializer_list<const char*> path) const {
        Node node = below(root_.get(), path);
        const std::size_t country = language_.rfind('_');
        if (node || country == std::string::npos) {
            return node;
        }
        const auto parent = open(language_.substr(0, country));
        return parent ? parent->find(path) : std::move(node);
    }

private:
    LanguageData(Node root, std::string language) : root_(std::move(root)), language_(std::move(language)) {}

    static Node below(const UResourceBundle* root, std::initializer_list<const char*> path) {
        Node node(nullptr, ures_close);
        const UResourceBundle* parent = root;
        for (const char* key : path) {
            UErrorCode status = U_ZERO_ERROR;
            Node child(ures_getByKey(parent, key, nullptr, &status), ures_close);
            if (U_FAILURE(status)) {
                return Node(nullptr, ures_close);
            }
            node = std::move(child);
            parent = node.get();
        }
        return node;
    }

    Node root_;
    std::string language_;
};

std::string textOf(const UResourceBundle* node) {
    int32_t length = 0;
    UErrorCode status = U_ZERO_ERROR;
    const UChar* const text = ures_getString(node, &length, &status);
    return U_SUCCESS(status) ? utf8Of(text, length) : std::string();
}

class IcuNormalizer : public Normalizer {
public:
    explicit IcuNormalizer(const UNormalizer2* normalizer) : normalizer_(normalizer) {}
    std::string normalized(std::string_view utf8) const override {
        const std::u16string text = utf16Of(utf8);
        std::u16string out(text.size() * 4 + 64, u'\0');
        for (;;) {
            UErrorCode status = U_ZERO_ERROR;
            const int32_t length =
                unorm2_normalize(normalizer_, text.data(), static_cast<int32_t>(text.size()), out.data(),
                                 static_cast<int32_t>(out.size()), &status);
            if (status != U_BUFFER_OVERFLOW_ERROR) {
                return U_SUCCESS(status) ? utf8Of(out.data(), length) : std::string(utf8);
            }
            out.resize(static_cast<std::size_t>(length));
        }
    }

private:
    const UNormalizer2* normalizer_;
};

} // namespace

std::optional<std::array<std::vector<std::string>, 12>> monthNames(const std::string& language) {
    const auto data = LanguageData::open(language);
    if (!data) {
        return std::nullopt;
    }
    std::array<std::vector<std::string>, 12> names;
    for (const char* context : {"format", "stand-alone"}) {
        for (const char* width : {"wide", "abbreviated"}) {
            const auto node = data->find({"calendar", "gregorian", "monthNames", context, width});
            const int32_t count = node ? std::min(ures_getSize(node.get()), 12) : 0;
            for (int32_t month = 0; month < count; ++month) {
                int32_t length = 0;
                UErrorCode status = U_ZERO_ERROR;
                const UChar* const text = ures_getStringByIndex(node.get(), month, &length, &status);
                std::string name = U_SUCCESS(status) ? utf8Of(text, length) : std::string();
                if (name.ends_with('.')) {
                    names[static_cast<std::size_t>(month)].push_back(name.substr(0, name.size() - 1));
                }
                names[static_cast<std::size_t>(month)].push_back(std::move(name));
            }
        }
    }
    return names.front().empty() ? std::nullopt : std::optional(names);
}

std::optional<NumberSigns> numberSigns(const std::string& language) {
    const auto data = LanguageData::open(language);
    if (!data) {
        return std::nullopt;
    }
    const auto decimal = data->find({"NumberElements", "latn", "symbols", "decimal"});
    const auto group = data->find({"NumberElements", "latn", "symbols", "group"});
    // What a language does not say is as in the root of the data.
    return NumberSigns{decimal ? textOf(decimal.get()) : ".", group ? textOf(group.get()) : ","};
}

std::string foldedName(std::string_view utf8) {
    const std::u16string text = utf16Of(utf8);
    std::u16string out(text.size() * 3 + 1, u'\0');
    UErrorCode status = U_ZERO_ERROR;
    const int32_t length = u_strFoldCase(out.data(), static_cast<int32_t>(out.size()), text.data(),
                                         static_cast<int32_t>(text.size()), U_FOLD_CASE_DEFAULT, &status);
    return U_SUCCESS(status) ? utf8Of(out.data(), length) : std::string(utf8);
}

bool isCurrencySign(char32_t character) {
    return u_charType(static_cast<UChar32>(character)) == U_CURRENCY_SYMBOL;
}

std::unique_ptr<Normalizer> makeNormalizer(const std::string& form) {
    UErrorCode status = U_ZERO_ERROR;
    const UNormalizer2* const normalizer = form == "nfc"    ? unorm2_getNFCInstance(&status)
                                           : form == "nfd"  ? unorm2_getNFDInstance(&status)
                                           : form == "nfkc" ? unorm2_getNFKCInstance(&status)
                                           : form == "nfkd" ? unorm2_getNFKDInstance(&status)
                                                            : nullptr;
    return normalizer == nullptr || U_FAILURE(status) ? nullptr : std::make_unique<IcuNormalizer>(normalizer);
}

bool isStateless(const std::string& encodingName) {
    UErrorCode status = U_ZERO_ERROR;
    const std::unique_ptr<UConverter, decltype(&ucnv_close)> converter(
        ucnv_open(encodingName.c_str(), &status), ucnv_close);
    if (U_FAILURE(status)) {
        return false;
    }
    switch (ucnv_getType(converter.get())) {
    case UCNV_SBCS:
    case UCNV_DBCS:
    case UCNV_MBCS:
    case UCNV_LATIN_1:
    case UCNV_UTF8:
    case UCNV_UTF16_BigEndian:
    case UCNV_UTF16_LittleEndian:
    case UCNV_UTF32_BigEndian:
    case UCNV_UTF32_LittleEndian:
    case UCNV_US_ASCII:
    case UCNV_CESU8:
        return true;
    default:
        return false;
    }
}

} // namespace host
