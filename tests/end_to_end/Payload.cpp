// Awkward names, texts and colours, as they come from command lines.
#include "end_to_end/Machine.h"
#include "end_to_end/Screenshot.h"

#include <gmock/gmock.h>

using namespace tests;
using testing::AllOf;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

namespace {

class Payload : public testing::Test {
protected:
    Payload()
    {
        m_machine.keepReport();
        m_machine.setScript("size 390 760\nwait picture\npicture payload.png\nprint {title}\ntap Cancel");
    }
    void expectUsageError(const Machine::Words& options, const std::string& about)
    {
        const auto end = m_machine.open(m_movie, options);
        EXPECT_EQ(end.exitStatus, 2);
        EXPECT_THAT(end.err, AllOf(StartsWith("clipsa: "), HasSubstr(about)));
        EXPECT_THAT(m_machine.report(), IsEmpty());
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }

    Machine m_machine;
    const std::filesystem::path m_movie = m_machine.movie("clock.mp4");
};

} // namespace

TEST_F(Payload, AVeryLongAppNameLeavesTheButtonsWhereTheyCanBeTouched)
{
    const auto end = m_machine.open(m_movie, {"--app-name", std::string(5000, 'W'), "--device", "phone"});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_THAT(m_machine.report(), ElementsAre(StartsWith("WWWW")));
}

TEST_F(Payload, AVeryLongMessageIsHandedOver)
{
    const auto end = m_machine.open(m_movie, {"--message", std::string(100'000, 'm')});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
}

TEST_F(Payload, ATintThatIsNoColourIsRefused)
{
    expectUsageError({"--tint", "reddish"}, "reddish");
}

TEST_F(Payload, AnAttachmentThatIsGoneIsRefused)
{
    expectUsageError({"--attachment", m_machine.home() / "gone.txt"}, "gone.txt");
}

TEST_F(Payload, AnAttachmentMayBeAnyFile)
{
    const auto end = m_machine.open(m_movie, {"--attachment", m_machine.write("home/notes.txt", "notes")});
    EXPECT_EQ(end.exitStatus, 0) << end.err;
    EXPECT_EQ(PrivateDirectory::read(m_machine.home() / "notes.txt"), "notes");
}

TEST_F(Payload, TheTintColoursTheTopBar)
{
    const auto end = m_machine.open(m_movie, {"--tint", "#c01c28", "--device", "phone"});
    ASSERT_EQ(end.exitStatus, 0) << end.err;
    const Screenshot screen(m_machine.picture("payload.png"));
    bool found = false;
    for (int y = 0; y < 60; ++y)
        for (int x = 0; x < 120; ++x) // where Cancel is
            found |= isNear(screen.at(x, y), QColor(0xc0, 0x1c, 0x28), 8);
    EXPECT_TRUE(found);
}

TEST_F(Payload, MoviesMayHaveAnyNameThatTheFileSystemTakes)
{
    for (const std::string& name : {std::string("100%20 #1?&=\"'\\ \n;$(x).mp4"), std::string("Aufnahme – 録画 🎬.mp4"),
                                    std::string("-movie.mp4"), std::string(251, 'n') + ".mp4", std::string("name")}) {
        SCOPED_TRACE(name);
        const auto movie = m_machine.home() / name;
        std::filesystem::copy_file(m_movie, movie);
        const auto end = m_machine.open(movie);
        EXPECT_EQ(end.exitStatus, 0) << end.err;
        EXPECT_TRUE(std::filesystem::exists(movie));
        EXPECT_THAT(m_machine.remains(), IsEmpty());
    }
}
