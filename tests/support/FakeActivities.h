/// What can be done, as a test says it, when a test says it. Main thread only.
#pragma once

#include "platform/sharing/ActivityProvider.h"

#include <string>
#include <utility>
#include <vector>

namespace tests {

class FakeActivity : public platform::Activity {
public:
    explicit FakeActivity(std::string type, std::string title = {})
        : m_type(std::move(type)), m_title(title.empty() ? m_type : std::move(title))
    {
    }

    std::string activityType() const override { return m_type; }
    std::string activityTitle() const override { return m_title; }
    bool canPerformWithActivityItems(const platform::ShareItems&) const override { return canPerform; }
    void prepareWithActivityItems(const platform::ShareItems& items) override { prepared.push_back(items); }
    void performActivity() override
    {
        ++performed;
        if (perform)
            perform(*this);
    }
    void cancel() override { ++cancelled; }
    std::string receiver() const override { return takenBy; }
    void tell(std::optional<double> progress) const { noteProgress(progress); }

    bool canPerform = true;
    std::vector<platform::ShareItems> prepared;
    int performed = 0;
    int cancelled = 0;
    std::string takenBy;
    std::function<void(FakeActivity&)> perform;

private:
    std::string m_type;
    std::string m_title;
};

class FakeActivities final : public platform::ActivityProvider {
public:
    void findActivities(const platform::ShareItems& items, Found found) override
    {
        asked.push_back(items);
        answers.push_back(std::move(found));
    }

    std::vector<platform::ShareItems> asked;
    /// One for each time that it was asked.
    std::vector<Found> answers;
};

} // namespace tests
