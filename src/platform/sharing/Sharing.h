/// The role of who shares: it knows what can be done with a movie, what files are called, and keeps account. Main queue only.
#pragma once

#include "platform/sharing/ActivityProvider.h"

#include <string>

namespace platform {

class Sharing {
public:
    virtual ~Sharing() = default;

    virtual ActivityProvider& activities() = 0;
    /// What receivers see as the file's name.
    virtual std::string nameOf(const base::Url& file) const = 0;
    /// Said of each activity that was performed, whether the receiver took it or not.
    virtual void activityEnded(const Activity& activity, const Activity::End& end) = 0;
};

} // namespace platform
