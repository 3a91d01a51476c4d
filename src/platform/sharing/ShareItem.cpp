#include "platform/sharing/ShareItem.h"

namespace platform {

std::vector<base::Url> filesOf(const ShareItems& items)
{
    std::vector<base::Url> files;
    for (const ShareItem& item : items)
        if (const auto* file = std::get_if<base::Url>(&item))
            files.push_back(*file);
    return files;
}

std::string textOf(const ShareItems& items)
{
    std::string whole;
    for (const ShareItem& item : items)
        if (const auto* text = std::get_if<std::string>(&item); text && !text->empty())
            whole += (whole.empty() ? "" : "\n") + *text;
    return whole;
}

} // namespace platform
