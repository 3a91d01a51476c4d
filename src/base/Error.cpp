#include "base/Error.h"

#include <system_error>
#include <utility>

namespace base {

Error::Error(std::string domain, std::int64_t code, UserInfo userInfo)
    : m_domain(std::move(domain)), m_code(code), m_userInfo(std::move(userInfo))
{
}

ErrorRef Error::make(std::string domain, std::int64_t code, std::string description)
{
    return std::make_shared<const Error>(std::move(domain), code, UserInfo{{kDescriptionKey, std::move(description)}});
}

ErrorRef Error::fromErrno(int number, const std::string& doing)
{
    return make(kPosixErrorDomain, number, doing + ": " + std::generic_category().message(number));
}

std::string Error::description() const
{
    if (const auto words = m_userInfo.find(kDescriptionKey); words != m_userInfo.end())
        return words->second;
    return m_domain + " error " + std::to_string(m_code);
}

} // namespace base
