// Points in time as texts.
#pragma once

#include "platform/core/Export.h"
#include "platform/core/Value.h"

#include <string>

namespace platform {

/// ISO 8601 in UTC, to the second: "2026-11-21T09:30:00Z"; empty for a date that the calendar does not reach.
KT_EXPORT std::string dateText(Date date);
/// The same in local time, for people: "2026-11-21 10:30".
KT_EXPORT std::string localDateText(Date date);

} // namespace platform
