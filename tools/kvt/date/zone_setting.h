// Another offset for a value: a fixed one, that of the machine's zone, or that of a zone by its name. What `date zone set`
// and the columns of `translate` have in common.
#pragma once

#include "date/outcome.h"
#include "zone/named_zone.h"

#include <kvt/datetime/datetime.h>

#include <optional>
#include <string>

namespace host {

class ZoneDatabaseOption;

/// The mode of that name, which was given for `what`. Throws Failure.
kvt::ex::datetime::SetZoneMode zoneMode(const std::string& what, const std::string& typed);

class ZoneSetting {
public:
    /// `zone` is an offset such as +01:00, "utc", "local" or the name of a zone. Throws Failure for any other, and where
    /// a zone database is needed and not good.
    ZoneSetting(const std::string& zone, kvt::ex::datetime::SetZoneMode mode,
                const ZoneDatabaseOption& database);

    DateOutcome apply(const kvt::ex::UString<0>& value) const;

private:
    DateOutcome applyNamed(const kvt::ex::UString<0>& value) const;

    kvt::ex::UString<0> zone_;
    kvt::ex::datetime::SetZoneMode mode_;
    std::optional<NamedZone> named_;
};

} // namespace host
