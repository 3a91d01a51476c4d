/// Gathers the payload's values from loads that end in any order, on any thread, and tells of them one after the other.
#pragma once

#include "extension/Payload.h"
#include "runtime/Value.h"

#include <functional>
#include <mutex>
#include <string_view>
#include <utility>
#include <vector>

class PayloadCollector {
public:
    using Tell = std::function<void(const PayloadValues&)>;

    explicit PayloadCollector(Tell tell) : m_tell(std::move(tell)) {}

    /// Keeps `item` as the value that `title` names; a title that names none, and an item that is empty or of a kind
    /// that the value cannot be, change nothing. Then tells what there is by now, once the required values are there.
    ///
    /// Values are told one at a time and in the order in which they came about, on a thread that collects: what comes
    /// while one thread tells is told by that thread, and the call that brought it returns at once.
    void collect(std::string_view title, const runtime::Value& item);

    bool hasAllRequired() const;

private:
    void keep(std::string_view title, const runtime::Value& item);

    const Tell m_tell;

    mutable std::mutex m_mutex;
    PayloadValues m_values;
    std::vector<PayloadValues> m_untold;
    bool m_telling = false;
};
