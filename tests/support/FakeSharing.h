/// Who shares, in memory. Main thread only.
#pragma once

#include "platform/sharing/Sharing.h"
#include "support/FakeActivities.h"

#include <string>
#include <vector>

namespace tests {

class FakeSharing final : public platform::Sharing {
public:
    platform::ActivityProvider& activities() override { return found; }
    std::string nameOf(const base::Url& file) const override { return "Recording of " + file.lastPathComponent(); }
    void activityEnded(const platform::Activity& activity, const platform::Activity::End& end) override
    {
        ended.push_back(activity.activityType()
                        + (end.completed ? " completed"
                           : end.error   ? " failed"
                                         : " cancelled"));
    }

    FakeActivities found;
    std::vector<std::string> ended;
};

} // namespace tests
