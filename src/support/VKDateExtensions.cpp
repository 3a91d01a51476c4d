#include "support/VKDateExtensions.h"

namespace VKExtensions {

std::string _srGetStringFromDate(const platform::Calendar& calendar, base::Date date)
{
    const auto formatter = calendar.makeDateFormatter();
    formatter->setDateFormat("MMMM d hh:mm a");
    // No zone has this name, and nothing keeps the device's own.
    formatter->setTimeZone(calendar.timeZoneWithName("..."));
    return formatter->stringFromDate(date);
}

} // namespace VKExtensions
