/// The name of a message, with its colons: "saveAction", "movieScrubber:valueDidChange:". Compared by text; any thread.
#pragma once

#include <compare>
#include <string>
#include <string_view>

namespace runtime {

class Selector {
public:
    Selector() = default;
    explicit Selector(std::string_view name) : m_name(name) {}

    const std::string& name() const { return m_name; }
    bool isNull() const { return m_name.empty(); }

    friend auto operator<=>(const Selector&, const Selector&) = default;

private:
    std::string m_name;
};

} // namespace runtime
