// The outcome of a call that may fail with a Throwable, in plain strings, to compare with the expected one.
#pragma once

#include <reference/icu_reference.h>

#include <kvt/encoding/encoding.h>
#include <kvt/foundation/throwable.h>

#include <string>

namespace kvt::test {

/// The first message and all pairs of a failure.
inline void describe(const kvt::ex::Throwable& failure, Outcome& outcome) {
    failure.processInfo(
        {}, {},
        [&](const kvt::ex::UString<0>& name, const kvt::ex::UString<0>& value) {
            outcome.pairs.emplace_back(name.toStdString(), value.toStdString());
        },
        [&](unsigned long number, const kvt::ex::UStringArray<0>& parameters) {
            outcome.number = number;
            for (const kvt::ex::UString<0>& parameter : parameters) {
                outcome.parameters.push_back(parameter.toStdString());
            }
        });
}

/// Runs `call`. The class of a failure has to be the one of its number, or the call's exception goes on.
template <typename Call>
Outcome outcomeOf(Call call) {
    Outcome outcome;
    try {
        call();
    } catch (const kvt::ex::UStringBadEncodingException& failure) {
        describe(failure, outcome);
        if (outcome.number != 910002) {
            throw;
        }
    } catch (const kvt::ex::UStringTranscodingException& failure) {
        describe(failure, outcome);
        if (outcome.number != 910003) {
            throw;
        }
    } catch (const kvt::ex::InvalidEncodingException& failure) {
        describe(failure, outcome);
        if (outcome.number != 910005) {
            throw;
        }
    }
    return outcome;
}

} // namespace kvt::test
