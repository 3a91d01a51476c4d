/// The words of a bundle's table "Localizable", with ICU's message patterns. Any thread.
#pragma once

#include "platform/files/Bundles.h"
#include "platform/files/MessageCatalog.h"

#include <string>
#include <vector>

namespace intl {

class MessageCatalog final : public platform::MessageCatalog {
public:
    /// Of the bundle at `path`, in the language that serves the user best; numbers as where the user lives.
    MessageCatalog(platform::Bundles& bundles, const std::string& path);

    std::string text(std::string_view key) const override;
    std::string text(std::string_view key, const std::vector<platform::MessageArgument>& arguments) const override;
    std::string duration(double seconds, int decimals) const override;
    std::string clock(double seconds) const override;
    std::string fileSize(std::int64_t bytes) const override;
    std::string list(const std::vector<std::string>& names) const override;
    bool isRightToLeft() const override { return m_isRightToLeft; }

private:
    platform::BundleRef m_words;   ///< null when there is none
    platform::BundleRef m_english; ///< the same
    std::string m_locale;
    bool m_isRightToLeft = false;
};

} // namespace intl
