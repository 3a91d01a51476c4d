#include "platform/files/MessageCatalog.h"

namespace platform {

std::string wordsFor(const base::Error& error, const MessageCatalog& words)
{
    const auto key = error.userInfo().find(base::Error::kMessageKey);
    if (key == error.userInfo().end())
        return error.description();
    std::vector<MessageArgument> places;
    for (const auto& [name, text] : error.userInfo())
        places.push_back({name.c_str(), text});
    std::string message = words.text(key->second, places);
    return message == key->second ? error.description() : message;
}

} // namespace platform
