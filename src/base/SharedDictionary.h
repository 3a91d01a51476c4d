/// A dictionary that threads share: every call is whole, whatever the others do. Values are given out as copies.
#pragma once

#include <map>
#include <mutex>
#include <optional>

namespace base {

template <typename Key, typename Value> class SharedDictionary {
public:
    SharedDictionary() = default;
    SharedDictionary(const SharedDictionary&) = delete;
    SharedDictionary& operator=(const SharedDictionary&) = delete;

    /// Nothing when there is no entry.
    std::optional<Value> object(const Key& key) const
    {
        const std::lock_guard lock(m_mutex);
        const auto found = m_entries.find(key);
        return found == m_entries.end() ? std::nullopt : std::optional(found->second);
    }

    /// In place of what was there.
    void setObject(Value value, const Key& key)
    {
        const std::lock_guard lock(m_mutex);
        m_entries.insert_or_assign(key, std::move(value));
    }

    std::size_t count() const
    {
        const std::lock_guard lock(m_mutex);
        return m_entries.size();
    }

private:
    mutable std::mutex m_mutex;
    std::map<Key, Value> m_entries;
};

} // namespace base
