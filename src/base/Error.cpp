#include "base/Error.h"

#include <cerrno>
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

ErrorRef Error::withMessage(const ErrorRef& error, std::string key, UserInfo places)
{
    places.insert_or_assign(kDescriptionKey, error->description());
    places.insert_or_assign(kMessageKey, std::move(key));
    return std::make_shared<const Error>(error->domain(), error->code(), std::move(places));
}

std::string Error::meaningOf(int number)
{
    switch (number) {
    case EACCES:
    case EPERM:
        return "that is not allowed";
    case EBUSY:
    case ETXTBSY:
        return "somebody else is using it";
    case ECANCELED:
        return "it was given up";
    case EDQUOT:
        return "your share of the disk is used up";
    case EEXIST:
        return "there is such a file already";
    case EFBIG:
        return "the disk takes no file that large";
    case EINVAL:
        return "it is not of the right kind";
    case EIO:
        return "the disk or the network has an error";
    case EISDIR:
        return "it is a directory";
    case ELOOP:
        return "it is a link that leads round in circles";
    case EMFILE:
    case ENFILE:
        return "too many files are open";
    case ENAMETOOLONG:
        return "the name is too long";
    case ENOENT:
        return "there is no such file or directory";
    case ENOMEM:
        return "there is not enough memory";
    case ENOSPC:
        return "the disk is full";
    case ENOTDIR:
        return "a part of its path is no directory";
    case EOPNOTSUPP:
    case ENOSYS:
        return "the disk cannot do that";
    case EROFS:
        return "the disk can only be read";
    case ESTALE:
    case ENODEV:
    case ENXIO:
        return "the disk or the network is not there any more";
    default:
        return std::generic_category().message(number);
    }
}

ErrorRef Error::fromErrno(int number, const std::string& doing)
{
    return make(kPosixErrorDomain, number, doing + ": " + meaningOf(number));
}

std::string Error::description() const
{
    if (const auto words = m_userInfo.find(kDescriptionKey); words != m_userInfo.end())
        return words->second;
    return m_domain + " error " + std::to_string(m_code);
}

} // namespace base
