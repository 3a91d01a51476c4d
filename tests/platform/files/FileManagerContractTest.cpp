/// What any file manager does, the fake and the real one alike.
#include "linux/xdg/FileManager.h"
#include "support/FakeFileManager.h"
#include "support/PrivateDirectory.h"
#include "support/TestSystem.h"

#include <gmock/gmock.h>

#include <cerrno>
#include <memory>

namespace {

using testing::IsEmpty;
using testing::UnorderedElementsAre;

/// A file manager and the means to put things before it. Its library is there, and empty.
class World {
public:
    virtual ~World() = default;
    virtual platform::FileManager& files() = 0;
    /// `path` is below the library.
    virtual void addFile(const std::string& path, std::size_t size) = 0;
    virtual void addText(const std::string& path, const std::string& text) = 0;
    virtual void addLink(const std::string& path, const std::string& target) = 0;
};

constexpr const char* kLibrary = "/private/var/mobile/Library";

class FakeWorld final : public World {
public:
    FakeWorld() { m_files.addDirectory(kLibrary); }
    platform::FileManager& files() override { return m_files; }
    void addFile(const std::string& path, std::size_t size) override
    {
        m_files.addFile(std::string(kLibrary) + "/" + path, static_cast<std::int64_t>(size));
    }
    void addText(const std::string& path, const std::string& text) override
    {
        m_files.addText(std::string(kLibrary) + "/" + path, text);
    }
    void addLink(const std::string& path, const std::string& target) override
    {
        m_files.addLink(std::string(kLibrary) + "/" + path, target);
    }

private:
    tests::TestSystem m_machine;
    tests::FakeFileManager m_files{m_machine.system};
};

class RealWorld final : public World {
public:
    platform::FileManager& files() override { return m_files; }
    void addFile(const std::string& path, std::size_t size) override
    {
        m_directory.write(path, std::string(size, 'x'));
    }
    void addText(const std::string& path, const std::string& text) override { m_directory.write(path, text); }
    void addLink(const std::string& path, const std::string& target) override
    {
        std::filesystem::create_symlink(m_files.resolvedPath(target), m_directory.path() / path);
    }

private:
    xdg::MountTable mounts() const
    {
        xdg::MountTable table;
        table.mount(kLibrary, m_directory.path());
        return table;
    }

    tests::TestSystem m_machine;
    tests::PrivateDirectory m_directory;
    xdg::FileManager m_files{m_machine.system, mounts()};
};

template <typename Kind> class AFileManager : public testing::Test {
protected:
    Kind world;
    platform::FileManager& files = world.files();

    static std::string at(const std::string& name) { return std::string(kLibrary) + "/" + name; }
    static int codeOf(const base::ErrorRef& error) { return error ? error->code32() : 0; }
    std::vector<std::string> names(const std::string& name) { return files.contentsOfDirectory(at(name)).value(); }
};

struct WorldNames {
    template <typename Kind> static std::string GetName(int)
    {
        return std::is_same_v<Kind, FakeWorld> ? "InMemory" : "OnDisk";
    }
};
using Worlds = testing::Types<FakeWorld, RealWorld>;
TYPED_TEST_SUITE(AFileManager, Worlds, WorldNames);

TYPED_TEST(AFileManager, IsItsOwnSharedOneByItself)
{
    EXPECT_EQ(&this->files.defaultManager(), &this->files);
}

TYPED_TEST(AFileManager, SeesFilesDirectoriesAndLinksToThemButNotDanglingLinks)
{
    this->world.addFile("file", 1);
    this->world.addLink("link", this->at("file"));
    this->world.addLink("dangling", this->at("nothing"));
    EXPECT_TRUE(this->files.fileExists(kLibrary));
    EXPECT_TRUE(this->files.fileExists(this->at("file")));
    EXPECT_TRUE(this->files.fileExists(this->at("link")));
    EXPECT_FALSE(this->files.fileExists(this->at("dangling")));
    EXPECT_FALSE(this->files.fileExists(this->at("nothing")));
    EXPECT_FALSE(this->files.fileExists(""));
}

TYPED_TEST(AFileManager, ReadsFilesThatAreNotTooLargeForTheirReader)
{
    this->world.addText("text", "a text");
    this->world.addFile("large", 7);
    this->world.addLink("link", this->at("text"));
    this->world.addText("empty", "");
    EXPECT_EQ(this->files.contentsOfFile(this->at("text"), 6).valueOr("?"), "a text");
    EXPECT_EQ(this->files.contentsOfFile(this->at("text"), 100).valueOr("?"), "a text");
    EXPECT_EQ(this->files.contentsOfFile(this->at("link"), 6).valueOr("?"), "a text");
    EXPECT_EQ(this->files.contentsOfFile(this->at("empty"), 0).valueOr("?"), "");
    EXPECT_EQ(this->codeOf(this->files.contentsOfFile(this->at("large"), 6).error()), EFBIG);
    EXPECT_EQ(this->codeOf(this->files.contentsOfFile(this->at("nothing"), 6).error()), ENOENT);
    EXPECT_EQ(this->codeOf(this->files.contentsOfFile(kLibrary, 6).error()), EISDIR);
}

TYPED_TEST(AFileManager, ReachesItemsThroughDoubledSlashes)
{
    this->world.addFile("store/file", 7);
    EXPECT_TRUE(this->files.fileExists(this->at("store//file")));
    EXPECT_EQ(this->files.attributesOfItem("//private/var//mobile/Library/store///file").value().size, 7);
    EXPECT_TRUE(this->files.removeItem(this->at("store//file")));
    EXPECT_THAT(this->names("store/"), IsEmpty());
}

TYPED_TEST(AFileManager, MakesADirectoryButNoneAboveItAndNoneTwice)
{
    EXPECT_EQ(this->codeOf(this->files.createDirectory(this->at("a/b")).error()), ENOENT);
    EXPECT_TRUE(this->files.createDirectory(this->at("a/")));
    EXPECT_TRUE(this->files.createDirectory(this->at("a/b")));
    EXPECT_EQ(this->codeOf(this->files.createDirectory(this->at("a")).error()), EEXIST);
    EXPECT_TRUE(this->files.attributesOfItem(this->at("a/b")).value().isDirectory);
    this->world.addFile("file", 1);
    EXPECT_EQ(this->codeOf(this->files.createDirectory(this->at("file/c")).error()), ENOTDIR);
}

TYPED_TEST(AFileManager, ListsNamesOfOneLevelWithDanglingLinks)
{
    this->world.addFile("store/a", 1);
    this->world.addFile("store/directory/b", 1);
    this->world.addFile("storehouse", 1);
    this->world.addLink("store/dangling", this->at("nothing"));
    EXPECT_THAT(this->names("store"), UnorderedElementsAre("a", "directory", "dangling"));
}

TYPED_TEST(AFileManager, ListsNoFileAndNothingThatIsMissing)
{
    this->world.addFile("file", 1);
    EXPECT_EQ(this->codeOf(this->files.contentsOfDirectory(this->at("file")).error()), ENOTDIR);
    EXPECT_EQ(this->codeOf(this->files.contentsOfDirectory(this->at("nothing")).error()), ENOENT);
}

TYPED_TEST(AFileManager, GivesTheAttributesOfALinkAndNotOfItsTarget)
{
    this->world.addFile("file", 100'000);
    this->world.addLink("link", this->at("file"));
    EXPECT_EQ(this->files.attributesOfItem(this->at("file")).value().size, 100'000);
    EXPECT_FALSE(this->files.attributesOfItem(this->at("file")).value().isDirectory);
    EXPECT_LT(this->files.attributesOfItem(this->at("link")).value().size, 1000);
    EXPECT_EQ(this->codeOf(this->files.attributesOfItem(this->at("nothing")).error()), ENOENT);
}

TYPED_TEST(AFileManager, NamesThePathOfWhatFailed)
{
    const base::ErrorRef error = this->files.attributesOfItem(this->at("not//there")).error();
    ASSERT_TRUE(error);
    EXPECT_EQ(error->domain(), base::kPosixErrorDomain);
    EXPECT_THAT(error->description(), testing::HasSubstr(this->at("not//there")));
}

TYPED_TEST(AFileManager, KnowsTheFreeSpaceOnlyWhereSomethingIs)
{
    EXPECT_GT(this->files.attributesOfFileSystem(kLibrary).value().freeSize, 0u);
    EXPECT_EQ(this->codeOf(this->files.attributesOfFileSystem(this->at("nothing")).error()), ENOENT);
}

TYPED_TEST(AFileManager, RemovesADirectoryWithAllThatItHolds)
{
    this->world.addFile("store/deep/er/file", 1);
    this->world.addFile("store2", 1);
    EXPECT_TRUE(this->files.removeItem(this->at("store")));
    EXPECT_THAT(this->names(""), UnorderedElementsAre("store2"));
}

TYPED_TEST(AFileManager, RemovesALinkAndNotItsTarget)
{
    this->world.addFile("store/file", 1);
    this->world.addLink("link", this->at("store"));
    EXPECT_TRUE(this->files.removeItem(this->at("link")));
    EXPECT_TRUE(this->files.fileExists(this->at("store/file")));
    EXPECT_THAT(this->names(""), UnorderedElementsAre("store"));
}

// Nor the root of all; but that is asked of a table alone (KnowsItsRootsHoweverTheyAreWritten): here, code that forgot it
// would remove this machine.
TYPED_TEST(AFileManager, DoesNotRemoveWhatIsMissing)
{
    EXPECT_EQ(this->codeOf(this->files.removeItem(this->at("nothing")).error()), ENOENT);
    EXPECT_EQ(this->codeOf(this->files.removeItem("").error()), ENOENT);
}

TYPED_TEST(AFileManager, MovesFilesAndFullDirectories)
{
    this->world.addFile("store/file", 5);
    EXPECT_TRUE(this->files.moveItem(this->at("store/file"), this->at("store/other")));
    EXPECT_TRUE(this->files.moveItem(this->at("store"), this->at("house")));
    EXPECT_THAT(this->names(""), UnorderedElementsAre("house"));
    EXPECT_EQ(this->files.attributesOfItem(this->at("house/other")).value().size, 5);
}

TYPED_TEST(AFileManager, NeverMovesOntoAnythingADanglingLinkIncluded)
{
    this->world.addFile("from", 5);
    this->world.addFile("to", 6);
    this->world.addLink("dangling", this->at("nothing"));
    EXPECT_EQ(this->codeOf(this->files.moveItem(this->at("from"), this->at("to")).error()), EEXIST);
    EXPECT_EQ(this->codeOf(this->files.moveItem(this->at("from"), this->at("dangling")).error()), EEXIST);
    EXPECT_EQ(this->files.attributesOfItem(this->at("to")).value().size, 6);
    EXPECT_EQ(this->files.attributesOfItem(this->at("from")).value().size, 5);
}

TYPED_TEST(AFileManager, DoesNotMoveWhatIsMissingNorIntoWhatIsMissingOrItself)
{
    this->world.addFile("store/file", 1);
    EXPECT_EQ(this->codeOf(this->files.moveItem(this->at("nothing"), this->at("to")).error()), ENOENT);
    EXPECT_EQ(this->codeOf(this->files.moveItem(this->at("store/file"), this->at("no/to")).error()), ENOENT);
    EXPECT_EQ(this->codeOf(this->files.moveItem(this->at("store"), this->at("store/in")).error()), EINVAL);
    EXPECT_TRUE(this->files.fileExists(this->at("store/file")));
}

} // namespace
