#include "linux/xdg/MountTable.h"

#include <algorithm>
#include <utility>

namespace xdg {

namespace {

std::vector<std::string> split(std::string_view path)
{
    std::vector<std::string> components;
    while (!path.empty()) {
        const auto slash = std::min(path.find('/'), path.size());
        if (slash > 0)
            components.emplace_back(path.substr(0, slash));
        path.remove_prefix(std::min(slash + 1, path.size()));
    }
    return components;
}

bool isAbsolute(std::string_view path)
{
    return path.starts_with('/');
}

} // namespace

void MountTable::mount(std::string_view prefix, std::string directory)
{
    Components components = split(prefix);
    std::erase_if(m_mounts, [&](const Mount& mount) { return mount.prefix == components; });
    m_mounts.push_back({std::move(components), std::move(directory)});
}

std::string MountTable::resolved(std::string_view path) const
{
    if (path.find('\0') != std::string_view::npos)
        return {};
    if (!isAbsolute(path))
        return std::string(path);
    const Components components = lexicallyResolved(path);
    const Mount* mount = longestMountOf(components);
    if (!mount)
        return std::string(path);
    std::string result = mount->directory;
    for (std::size_t i = mount->prefix.size(); i < components.size(); ++i)
        result += "/" + components[i];
    return result;
}

bool MountTable::isRoot(std::string_view path) const
{
    if (!isAbsolute(path))
        return false;
    const Components components = lexicallyResolved(path);
    return components.empty() || isMountRoot(components);
}

MountTable::Components MountTable::lexicallyResolved(std::string_view path) const
{
    Components components;
    for (std::string& component : split(path)) {
        if (component == ".")
            continue;
        if (component != "..")
            components.push_back(std::move(component));
        else if (!components.empty() && !isMountRoot(components))
            components.pop_back();
    }
    return components;
}

const MountTable::Mount* MountTable::longestMountOf(const Components& components) const
{
    const Mount* longest = nullptr;
    for (const Mount& mount : m_mounts) {
        const bool holds = mount.prefix.size() <= components.size()
                           && std::equal(mount.prefix.begin(), mount.prefix.end(), components.begin());
        if (holds && (!longest || mount.prefix.size() > longest->prefix.size()))
            longest = &mount;
    }
    return longest;
}

bool MountTable::isMountRoot(const Components& components) const
{
    return std::any_of(m_mounts.begin(), m_mounts.end(),
                       [&](const Mount& mount) { return mount.prefix == components; });
}

} // namespace xdg
