/// A date in a few words, as titles show it. Any thread.
#pragma once

#include "base/Date.h"
#include "platform/files/DateFormatter.h"

#include <string>

namespace VKExtensions {

/// "March 5 09:07 PM", in the device's current zone and locale at the time of the call. Makes a formatter every time.
std::string _srGetStringFromDate(const platform::Calendar& calendar, base::Date date);

} // namespace VKExtensions
