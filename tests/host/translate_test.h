// What tests of `kvt translate` have in common.
#pragma once

#include "host_test.h"

#include <string>
#include <utility>
#include <vector>

namespace kvt::test {

class TranslateTest : public HostTest {
protected:
    ChildResult translate(const std::string& input, std::vector<std::string> arguments) const {
        arguments.insert(arguments.begin(), "translate");
        return kvt(std::move(arguments), input);
    }
    /// What is written where nothing fails.
    std::string out(const std::string& input, std::vector<std::string> arguments) const {
        const ChildResult result = translate(input, std::move(arguments));
        EXPECT_EQ(result.status, 0) << result.err;
        return result.out;
    }
};

} // namespace kvt::test
