// Tests that run once for each instruction set that this processor has and the library is compiled for, and once
// without any.
#pragma once

#include <kvt/platform/vector_targets.h>

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace kvt::test {

/// Each alone, as Highway numbers them.
inline std::vector<std::int64_t> vectorTargets() {
    std::vector<std::int64_t> targets;
    auto left = static_cast<std::uint64_t>(platform::processorTargets() & (HWY_TARGETS | HWY_STATIC_TARGET));
    for (; left != 0; left &= left - 1) {
        targets.push_back(static_cast<std::int64_t>(left & (0 - left)));
    }
    return targets;
}

/// A case of a fixture that derives from this has the library use the target that is its parameter.
class OnEachVectorTarget : public testing::TestWithParam<std::int64_t> {
protected:
    void SetUp() override { platform::forceProcessorTargets(GetParam()); }
    void TearDown() override { platform::forceProcessorTargets(0); }
};

inline std::string vectorTargetName(const testing::TestParamInfo<std::int64_t>& target) {
    return hwy::TargetName(target.param);
}

} // namespace kvt::test
