// The functions of the C library by which the machine is asked for its time, replaced in this program.
#include "machine_clock.h"

#include <dlfcn.h>

namespace kvt::test {

namespace {

bool isSteered = false;
std::optional<std::tm> steered;

} // namespace

LocalTime::LocalTime(std::optional<std::tm> now) {
    steered = now;
    isSteered = true;
}

LocalTime::~LocalTime() {
    isSteered = false;
}

} // namespace kvt::test

// This one stands before that of the C library, for every part of the program.
extern "C" std::tm* localtime_r(const std::time_t* __restrict seconds, std::tm* __restrict result) noexcept {
    if (!kvt::test::isSteered) {
        using Localtime = std::tm* (*)(const std::time_t*, std::tm*);
        static const auto real = reinterpret_cast<Localtime>(::dlsym(RTLD_NEXT, "localtime_r"));
        return real(seconds, result);
    }
    if (!kvt::test::steered) {
        return nullptr;
    }
    *result = *kvt::test::steered;
    return result;
}
