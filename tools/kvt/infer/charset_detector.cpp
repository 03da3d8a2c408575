#include "infer/charset_detector.h"

#include <unicode/ucsdet.h>

#include <cstdint>
#include <limits>
#include <memory>

namespace host {

std::vector<CharsetGuess> detectCharsets(std::string_view bytes) {
    constexpr std::size_t most = std::numeric_limits<std::int32_t>::max();
    UErrorCode error = U_ZERO_ERROR;
    const std::unique_ptr<UCharsetDetector, decltype(&ucsdet_close)> detector(ucsdet_open(&error),
                                                                              ucsdet_close);
    ucsdet_setText(detector.get(), bytes.data(), static_cast<std::int32_t>(std::min(bytes.size(), most)),
                   &error);
    std::int32_t count = 0;
    const UCharsetMatch** const matches = ucsdet_detectAll(detector.get(), &count, &error);
    std::vector<CharsetGuess> guesses;
    for (std::int32_t i = 0; U_SUCCESS(error) && i < count; ++i) {
        const char* const name = ucsdet_getName(matches[i], &error);
        const std::int32_t confidence = ucsdet_getConfidence(matches[i], &error);
        if (U_SUCCESS(error)) {
            guesses.push_back({name, confidence});
        }
    }
    return guesses;
}

} // namespace host
