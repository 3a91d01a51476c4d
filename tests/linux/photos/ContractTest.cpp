// What every photo library does, the fake one included.

#include "linux/photos/LibraryFixture.h"
#include "support/FakePhotoLibrary.h"

#include <memory>

namespace {

using testing::ElementsAre;
using testing::IsEmpty;

/// A library, a way to let it do all that it has to do, and what it holds then.
class Subject {
public:
    virtual ~Subject() = default;
    virtual platform::PhotoLibrary& library() = 0;
    virtual void settle() = 0;
    virtual std::size_t assets() = 0;
};

class FakeSubject final : public Subject {
public:
    platform::PhotoLibrary& library() override { return m_library; }
    void settle() override
    {
        while (m_library.isBusy())
            m_library.finish();
    }
    std::size_t assets() override { return m_library.assets.size(); }

private:
    tests::FakePhotoLibrary m_library;
};

class RealSubject final : public Subject {
public:
    explicit RealSubject(std::string videos) : m_videos(std::move(videos)) { begin(); }
    platform::PhotoLibrary& library() override { return *m_current; }
    void settle() override
    {
        m_library.reset();
        begin();
    }
    std::size_t assets() override { return tests::namesIn(m_videos).size(); }

private:
    void begin()
    {
        photos::LibraryOptions options;
        options.directories = {m_videos, m_videos + "/../thumbnails", m_videos + "/../recent.xbel"};
        m_library = std::make_unique<photos::VideoLibrary>(options, m_log, m_works);
        m_current = m_library.get();
    }

    const std::string m_videos;
    base::MemoryLog m_log;
    base::WorkList m_works;
    std::unique_ptr<photos::VideoLibrary> m_library;
    photos::VideoLibrary* m_current = nullptr;
};

enum class Kind { Fake, Real };

class APhotoLibrary : public testing::TestWithParam<Kind> {
protected:
    tests::PrivateDirectory home;
    const base::Url movie = base::Url::fromPath(home.write("movie.mp4", "a movie"));
    std::unique_ptr<Subject> subject;
    std::vector<std::string> story;

    void SetUp() override
    {
        if (GetParam() == Kind::Fake)
            subject = std::make_unique<FakeSubject>();
        else
            subject = std::make_unique<RealSubject>(home.path() / "Videos");
    }

    void save(const std::string& what, const std::vector<std::optional<base::Url>>& urls)
    {
        subject->library().performChanges(
            [this, what, urls](platform::PhotoLibraryChange& change) {
                story.push_back("change " + what);
                for (const auto& url : urls)
                    change.createAssetFromVideoAtFileURL(url);
            },
            [this, what](bool success, const base::ErrorRef& error) {
                EXPECT_EQ(success, !error);
                story.push_back((success ? "saved " : "failed ") + what);
            });
    }
};

TEST_P(APhotoLibrary, TakesAMovieAndSaysSoOnce)
{
    save("it", {movie});
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change it", "saved it"));
    EXPECT_EQ(subject->assets(), 1U);
    EXPECT_EQ(tests::PrivateDirectory::read(movie.path()), "a movie") << "the movie is left where it was";
}

TEST_P(APhotoLibrary, TakesTheSameMovieAgain)
{
    save("one", {movie});
    subject->settle();
    save("two", {movie});
    subject->settle();
    EXPECT_EQ(subject->assets(), 2U);
}

TEST_P(APhotoLibrary, TakesAllMoviesOfOneTransaction)
{
    save("both", {movie, movie});
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change both", "saved both"));
    EXPECT_EQ(subject->assets(), 2U);
}

TEST_P(APhotoLibrary, FailsWithoutAMovie)
{
    save("nothing", {std::nullopt});
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change nothing", "failed nothing"));
    EXPECT_EQ(subject->assets(), 0U);
}

TEST_P(APhotoLibrary, TakesAllMoviesOfATransactionOrNone)
{
    save("one and nothing", {movie, std::nullopt});
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change one and nothing", "failed one and nothing"));
    EXPECT_EQ(subject->assets(), 0U);
}

TEST_P(APhotoLibrary, SucceedsWhenNothingIsAskedFor)
{
    save("nothing", {});
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change nothing", "saved nothing"));
    EXPECT_EQ(subject->assets(), 0U);
}

TEST_P(APhotoLibrary, GoesOnAfterAFailure)
{
    save("nothing", {std::nullopt});
    save("it", {movie});
    subject->settle();
    EXPECT_EQ(subject->assets(), 1U);
}

TEST_P(APhotoLibrary, LetsGoOfWhatItWasGivenWhenItIsDone)
{
    const auto held = std::make_shared<int>();
    subject->library().performChanges([held](platform::PhotoLibraryChange&) {}, [held](bool, const base::ErrorRef&) {});
    subject->settle();
    EXPECT_EQ(held.use_count(), 1);
}

TEST_P(APhotoLibrary, TakesANewTransactionFromACompletion)
{
    subject->library().performChanges([](platform::PhotoLibraryChange&) {},
                                      [this](bool, const base::ErrorRef&) { save("it", {movie}); });
    subject->settle();
    EXPECT_THAT(story, ElementsAre("change it", "saved it"));
}

INSTANTIATE_TEST_SUITE_P(Fake, APhotoLibrary, testing::Values(Kind::Fake));
INSTANTIATE_TEST_SUITE_P(Real, APhotoLibrary, testing::Values(Kind::Real));

TEST(TheFakePhotoLibrary, RunsBlocksAndEndsTransactionsWhenItIsTold)
{
    tests::FakePhotoLibrary library;
    library.runsBlocksAtOnce = false;
    std::vector<std::string> story;
    library.performChanges(
        [&](platform::PhotoLibraryChange& change) {
            story.emplace_back("change");
            change.createAssetFromVideoAtFileURL(base::Url::fromPath("/a.mp4"));
        },
        [&](bool success, const base::ErrorRef& error) {
            EXPECT_FALSE(success);
            story.push_back(error->description());
        });
    EXPECT_THAT(story, IsEmpty());
    library.runBlock();
    EXPECT_THAT(library.urls, ElementsAre(base::Url::fromPath("/a.mp4")));
    EXPECT_THAT(story, ElementsAre("change"));
    library.fail(base::Error::make("test", 7, "no room"));
    EXPECT_THAT(story, ElementsAre("change", "no room"));
    EXPECT_THAT(library.assets, IsEmpty());
}

} // namespace
