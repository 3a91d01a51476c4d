/// A file system in memory, whose failures are scripted and whose calls are recorded. One thread at a time.
///
///     tests::TestSystem machine;
///     tests::FakeFileManager files(machine.system);
///     files.addFile("/a/b.mp4", 100);                                  // with the directories above it
///     files.fail(tests::FileOperation::Remove, "/a/b.mp4", EACCES);
///     …
///     EXPECT_THAT(files.calls, ElementsAre("exists /a/b.mp4", "remove /a/b.mp4"));
///
/// Paths with doubled slashes are the same as without; calls are recorded as they came. Listings are in the order in
/// which the items were added. Links are followed in the last component only, and only to absolute targets.
#pragma once

#include "platform/files/FileManager.h"
#include "support/CallListener.h"

#include <algorithm>
#include <cerrno>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace tests {

enum class FileOperation { CreateDirectory, List, Read, Attributes, FileSystem, Remove, Move };

class FakeFileManager final : public platform::FileManager {
public:
    explicit FakeFileManager(const base::System& system) : m_system(system) {}

    /// What was asked of this manager, in order.
    std::vector<std::string> calls;
    /// Hears of it, too.
    const CallListenerRef listener = std::make_shared<CallListener>();
    /// Bytes free everywhere.
    std::uint64_t freeSize = 1'000'000'000;
    /// The shared manager, when it shall be another.
    platform::FileManager* shared = nullptr;
    /// What other programs put before paths.
    std::string resolvedPrefix;

    /// Modified and created at the same moment: now, unless told otherwise.
    void addFile(const std::string& path, std::int64_t size) { addFile(path, size, m_system.clock.date()); }
    void addFile(const std::string& path, std::int64_t size, base::Date date) { addFile(path, size, date, date); }
    void addFile(const std::string& path, std::int64_t size, base::Date modified, base::Date created)
    {
        add(path, {{size, modified, created, false}, {}, {}});
    }
    void addText(const std::string& path, const std::string& text)
    {
        const base::Date now = m_system.clock.date();
        add(path, {{static_cast<std::int64_t>(text.size()), now, now, false}, {}, text});
    }
    void addDirectory(const std::string& path) { add(path, directory()); }
    void addLink(const std::string& path, const std::string& target)
    {
        const base::Date now = m_system.clock.date();
        add(path, {{static_cast<std::int64_t>(target.size()), now, now, false}, target, {}});
    }
    /// Whether an item of any kind, dangling links included, has this path.
    bool holds(const std::string& path) const { return find(normalised(path)) != m_items.end(); }

    /// Makes the operation fail on this path (a move: from it) from now on. Gives the error that callers will get.
    base::ErrorRef fail(FileOperation operation, const std::string& path, int number)
    {
        base::ErrorRef error = base::Error::fromErrno(number, "scripted: " + path);
        m_failures[{operation, normalised(path)}] = error;
        return error;
    }

    platform::FileManager& defaultManager() override { return shared ? *shared : *this; }
    const base::System& system() const override { return m_system; }

    bool fileExists(const std::string& path) override
    {
        note("exists " + path);
        std::string at = normalised(path);
        for (int links = 0; links < kMostLinks; ++links) {
            const auto item = find(at);
            if (item == m_items.end())
                return at.empty() && path.starts_with('/');
            if (item->second.linkTarget.empty())
                return true;
            at = normalised(item->second.linkTarget);
        }
        return false;
    }

    base::Result<void> createDirectory(const std::string& path) override
    {
        note("create directory " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::CreateDirectory, at))
            return error;
        if (at.empty() || holds(at))
            return failed(EEXIST, calls.back());
        if (const int number = parentTrouble(at); number != 0)
            return failed(number, calls.back());
        m_items.emplace_back(at, directory());
        return {};
    }

    base::Result<std::vector<std::string>> contentsOfDirectory(const std::string& path) override
    {
        note("list " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::List, at))
            return error;
        if (const int number = parentTrouble(at + "/name"); number != 0)
            return failed(number, calls.back());
        std::vector<std::string> names;
        for (const auto& [itemPath, item] : m_items)
            if (parentOf(itemPath) == at)
                names.push_back(itemPath.substr(at.size() + 1));
        return names;
    }

    base::Result<std::string> contentsOfFile(const std::string& path, std::size_t mostBytes) override
    {
        note("read " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::Read, at))
            return error;
        const auto item = find(at);
        if (item == m_items.end())
            return failed(ENOENT, calls.back());
        if (item->second.attributes.isDirectory)
            return failed(EISDIR, calls.back());
        if (!item->second.linkTarget.empty())
            return contentsOfFile(item->second.linkTarget, mostBytes);
        if (item->second.attributes.size > static_cast<std::int64_t>(mostBytes))
            return failed(EFBIG, calls.back());
        return item->second.text;
    }

    base::Result<platform::FileAttributes> attributesOfItem(const std::string& path) override
    {
        note("attributes " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::Attributes, at))
            return error;
        const auto item = find(at);
        if (item == m_items.end())
            return failed(ENOENT, calls.back());
        return item->second.attributes;
    }

    base::Result<platform::FileSystemAttributes> attributesOfFileSystem(const std::string& path) override
    {
        note("file system " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::FileSystem, at))
            return error;
        if (!at.empty() && !holds(at))
            return failed(ENOENT, calls.back());
        return platform::FileSystemAttributes{freeSize};
    }

    base::Result<void> removeItem(const std::string& path) override
    {
        note("remove " + path);
        const std::string at = normalised(path);
        if (auto error = scripted(FileOperation::Remove, at))
            return error;
        if (at.empty())
            return failed(path.empty() ? ENOENT : EBUSY, calls.back());
        if (std::erase_if(m_items, [&](const auto& item) { return isWithin(item.first, at); }) == 0)
            return failed(ENOENT, calls.back());
        return {};
    }

    base::Result<void> moveItem(const std::string& from, const std::string& to) override
    {
        note("move " + from + " to " + to);
        const std::string source = normalised(from);
        const std::string destination = normalised(to);
        if (auto error = scripted(FileOperation::Move, source))
            return error;
        if (!holds(source))
            return failed(ENOENT, calls.back());
        if (holds(destination))
            return failed(EEXIST, calls.back());
        if (isWithin(destination, source))
            return failed(EINVAL, calls.back());
        if (const int number = parentTrouble(destination); number != 0)
            return failed(number, calls.back());
        for (auto& [path, item] : m_items)
            if (isWithin(path, source))
                path.replace(0, source.size(), destination);
        return {};
    }

    std::string resolvedPath(const std::string& path) const override { return resolvedPrefix + path; }

private:
    static constexpr int kMostLinks = 40;

    struct Item {
        platform::FileAttributes attributes;
        std::string linkTarget; ///< empty in what is no link
        std::string text;       ///< empty where only its size matters
    };
    using Items = std::vector<std::pair<std::string, Item>>;

    /// Single slashes, none at the end; the root is empty.
    static std::string normalised(const std::string& path)
    {
        std::string result;
        for (const char character : path)
            if (character != '/' || !result.ends_with('/'))
                result += character;
        if (result.ends_with('/'))
            result.pop_back();
        return result;
    }
    void note(const std::string& call)
    {
        calls.push_back(call);
        (*listener)(call);
    }
    static std::string parentOf(const std::string& path)
    {
        return path.substr(0, std::min(path.rfind('/'), path.size()));
    }
    static bool isWithin(const std::string& path, const std::string& item)
    {
        return path == item || path.starts_with(item + "/");
    }
    static base::ErrorRef failed(int number, const std::string& doing) { return base::Error::fromErrno(number, doing); }

    Item directory() const
    {
        constexpr std::int64_t kEntrySize = 4096;
        const base::Date now = m_system.clock.date();
        return {{kEntrySize, now, now, true}, {}, {}};
    }

    void add(const std::string& path, Item item)
    {
        const std::string at = normalised(path);
        if (const std::string parent = parentOf(at); !parent.empty() && !holds(parent))
            add(parent, directory());
        std::erase_if(m_items, [&](const auto& other) { return other.first == at; });
        m_items.emplace_back(at, std::move(item));
    }

    Items::const_iterator find(const std::string& at) const
    {
        return std::find_if(m_items.begin(), m_items.end(), [&](const auto& item) { return item.first == at; });
    }

    int parentTrouble(const std::string& path) const
    {
        const std::string parent = parentOf(path);
        if (parent.empty())
            return 0;
        const auto item = find(parent);
        if (item == m_items.end())
            return ENOENT;
        return item->second.attributes.isDirectory ? 0 : ENOTDIR;
    }

    base::ErrorRef scripted(FileOperation operation, const std::string& at) const
    {
        const auto failure = m_failures.find({operation, at});
        return failure != m_failures.end() ? failure->second : nullptr;
    }

    const base::System& m_system;
    Items m_items;
    std::map<std::pair<FileOperation, std::string>, base::ErrorRef> m_failures;
};

} // namespace tests
