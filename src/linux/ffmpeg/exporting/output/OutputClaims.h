/// Which files are being written: of two exports to one name the one that came second fails, and at once. Any thread.
#pragma once

#include <map>
#include <memory>
#include <mutex>
#include <string>

namespace ffmpeg {

/// Its path is taken as long as somebody holds it.
using OutputClaim = std::shared_ptr<const void>;

class OutputClaims {
public:
    /// Null when the path is taken.
    OutputClaim take(const std::string& path)
    {
        const std::lock_guard lock(m_mutex);
        std::erase_if(m_claims, [](const auto& each) { return each.second.expired(); });
        std::weak_ptr<const void>& claim = m_claims[path];
        if (!claim.expired())
            return nullptr;
        OutputClaim taken = std::make_shared<const char>();
        claim = taken;
        return taken;
    }

private:
    std::mutex m_mutex;
    std::map<std::string, std::weak_ptr<const void>> m_claims;
};

} // namespace ffmpeg
