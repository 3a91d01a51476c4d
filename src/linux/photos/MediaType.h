/// What kind of movie a file's name says that it is, as desktops write it ("video/mp4"). Any thread.
#pragma once

#include <string>
#include <string_view>

namespace photos {

inline std::string mediaType(std::string_view path)
{
    static constexpr std::string_view kTypes[][2] = {
        {".mp4", "video/mp4"},       {".m4v", "video/mp4"},       {".webm", "video/webm"}, {".mkv", "video/x-matroska"},
        {".mov", "video/quicktime"}, {".avi", "video/x-msvideo"}, {".ts", "video/mp2t"},   {".ogv", "video/ogg"}};
    for (const auto& [extension, type] : kTypes)
        if (path.ends_with(extension))
            return std::string(type);
    return "application/octet-stream";
}

} // namespace photos
