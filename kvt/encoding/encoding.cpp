// What an Encoding answers about itself.
#include <kvt/encoding/encoding.h>

#include <kvt/encoding/detail/encoding_registry.h>
#include <kvt/encoding/icu_transcoder.h>
#include <kvt/foundation/throwable.h>

#include <algorithm>
#include <array>

namespace kvt::ex {

Encoding::Encoding(kvt::future::string_view name) : Encoding(name, nothrow) {
    if (id_ == Unknown) {
        throw InvalidEncodingException(UString<0>(UStringView<0>(name)));
    }
}

Encoding::Encoding(kvt::future::string_view name, nothrow_t)
    : id_(detail::EncodingRegistry::instance().lookupId(name)) {}

kvt::future::string_view Encoding::getName() const {
    return detail::EncodingRegistry::instance().nameOf(id_);
}

kvt::future::string_view Encoding::getUnevaluatedName() const {
    return id_ == System ? "zqt-system" : getName();
}

Encoding::Type Encoding::evaluatedSystem() {
    // The system's name is a key of the registry, so the look-up cannot fail.
    static const auto type = static_cast<Type>(Encoding(Encoding(System).getName()).id());
    return type;
}

bool Encoding::isSingleByte() const {
    const std::uint32_t evaluated = evaluate();
    if (evaluated == Unknown || evaluated == Binary) {
        return false;
    }
    return ICUTranscoder::isSingleByteEncoding(*this);
}

bool Encoding::supports7BitASCII() const {
    const std::uint32_t evaluated = evaluate();
    if (evaluated <= UsAscii || (evaluated >= Iso8859_1 && evaluated <= Windows1258)) {
        return true;
    }
    if (evaluated != System && evaluated <= Unknown) {
        return false;
    }
    static const std::array compatible = {
        Encoding("ibm-5471_P100-2006"),
        windowsCodePage<874>(),
        windowsCodePage<936>(),
        windowsCodePage<949>(),
        windowsCodePage<950>(),
        windowsCodePage<10000>(),
        windowsCodePage<10006>(),
        windowsCodePage<10007>(),
        windowsCodePage<10029>(),
        Encoding("EUC-JP"),
        Encoding("EUC-KR"),
        Encoding("KOI8-R"),
    };
    return std::find(compatible.begin(), compatible.end(), *this) != compatible.end();
}

} // namespace kvt::ex
