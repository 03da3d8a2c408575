// Every float there is: its text has the shortest digits and reads back to it. That takes a quarter of an hour of one
// processor, so that it is a program of its own, which `./dev test --exhaustive` runs, in two processes.
#include <codec/float_text_reference.h>

#include <kvt/codec/float_text.h>

#include <gtest/gtest.h>

#include <array>
#include <bit>
#include <charconv>
#include <cmath>
#include <cstdint>
#include <string>
#include <string_view>

namespace kvt::test {
namespace {

constexpr std::uint32_t parts = 256;

class FloatTextOfEveryFloat : public ::testing::TestWithParam<std::uint32_t> {};

TEST_P(FloatTextOfEveryFloat, HasShortestDigitsAndReadsBack) {
    constexpr std::uint32_t size = (1ULL << 32) / parts;
    std::array<char, kvt::ex::floatTextBuffer> buffer;
    std::uint32_t wrong = 0;
    for (std::uint32_t i = 0; i < size; ++i) {
        const std::uint32_t bits = GetParam() * size + i;
        const auto value = std::bit_cast<float>(bits);
        const std::string_view text(buffer.data(), kvt::ex::float_to_string(value, buffer.data()));
        float read = value;
        if (!std::isnan(value)) {
            std::from_chars(text.data(), text.data() + text.size(), read);
        }
        if ((text != referenceText(value) || std::bit_cast<std::uint32_t>(read) != bits) && ++wrong <= 10) {
            ADD_FAILURE() << text << " for " << std::hex << bits << ", wanted " << referenceText(value);
        }
    }
    EXPECT_EQ(wrong, 0U);
}

INSTANTIATE_TEST_SUITE_P(Part, FloatTextOfEveryFloat, ::testing::Range(0U, parts));

} // namespace
} // namespace kvt::test
