#include "translate/problem.h"

#include "base/messages.h"

namespace host {

Problem makeProblem(std::uint32_t number, const std::vector<std::string>& parameters) {
    return {number, describe(number, parameters)};
}

} // namespace host
