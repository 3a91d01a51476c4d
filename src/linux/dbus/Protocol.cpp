#include "linux/dbus/Protocol.h"

namespace dbus {

std::string interfaceName(const std::string& protocol)
{
    return "org.clipsa." + protocol;
}

std::string memberName(const runtime::Selector& selector)
{
    std::string member;
    bool wordStarts = true;
    for (const char character : selector.name()) {
        if (character == ':') {
            wordStarts = true;
            continue;
        }
        const bool lower = character >= 'a' && character <= 'z';
        member += wordStarts && lower ? static_cast<char>(character - 'a' + 'A') : character;
        wordStarts = false;
    }
    return member;
}

} // namespace dbus
