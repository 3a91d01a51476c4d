#include "support/VKErrorExtensions.h"

#include <string>
#include <utility>

namespace VKExtensions {

namespace {

std::string descriptionForCode(std::int64_t code)
{
    switch (code) {
    case VKErrorNoMovie:
        return "There is no movie to save. Record it again, or open the file itself.";
    case VKErrorExportFailed:
        return "The movie could not be exported. It is still there as it was.";
    default:
        return "Something went wrong (error " + std::to_string(code) + ").";
    }
}

} // namespace

base::ErrorRef _vkUserErrorForCode_userInfo(std::int64_t code, base::Error::UserInfo userInfo)
{
    userInfo.try_emplace(base::Error::kDescriptionKey, descriptionForCode(code));
    return std::make_shared<const base::Error>(VKUserErrorDomain, code, std::move(userInfo));
}

} // namespace VKExtensions
