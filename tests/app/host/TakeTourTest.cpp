// `clipsa tour`, with an editor that leaves what a test says: what is told of it, and what counts as done.
#include "app/host/ClipsaProgram.h"
#include "support/WithoutPrivileges.h"

#include <gmock/gmock.h>

#include <sys/stat.h>

namespace {

using testing::AllOf;
using testing::EndsWith;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::StartsWith;

using tests::namesIn;
using tests::PrivateDirectory;
using tests::Words;

namespace fs = std::filesystem;

class ATour : public tests::ClipsaProgram {
protected:
    ATour()
    {
        const auto editor =
            directory.write("editor", "#!/bin/sh\n"
                                      "env >\"$TOUR_SEEN\"\n"
                                      "cd \"$CLIPSA_PICTURES\" || exit 99\n"
                                      "[ -z \"$TOUR_REPORT\" ] || printf \"$TOUR_REPORT\" >\"$CLIPSA_REPORT\"\n"
                                      "for name in $TOUR_PICTURES; do echo picture >\"$name\"; done\n"
                                      "exec \"$TOUR_EDITOR\" \"$@\"\n");
        ::chmod(editor.c_str(), 0700);
        fs::create_directory(directory.path() / "temporary");
        m_variables = {{"CLIPSA_EDITOR", editor},
                       {"TOUR_EDITOR", tests::program("fake-editor")},
                       {"TOUR_SEEN", m_seen},
                       {"TOUR_PICTURES", "1-upright.png 2-level.png"},
                       {"TOUR_REPORT", "Title Notes and more\\nalone\\npicture 1-upright.png the start\\n"
                                       "picture 2-level.png turned\\nend reached\\n"},
                       {"FAKE_EDITOR", "finish=save,share wait"},
                       {"TMPDIR", directory.path() / "temporary"},
                       {"XDG_CACHE_HOME", directory.path() / "cache"}};
    }

    int take(const tests::Program::Variables& changed = {})
    {
        auto variables = m_variables;
        for (const auto& [name, value] : changed)
            variables[name] = value;
        return run({"tour", m_movie, "--output", folder}, variables);
    }
    std::string seen(const std::string& variable) const
    {
        const std::string all = "\n" + PrivateDirectory::read(m_seen);
        const std::size_t at = all.find("\n" + variable + "=");
        if (at == std::string::npos)
            return "(unset)";
        const std::size_t start = at + variable.size() + 2;
        return all.substr(start, all.find('\n', start) - start);
    }

    const fs::path folder = fs::canonical(directory.path()) / "new/pictures";
    const fs::path m_movie = fs::canonical(directory.write("race.mp4", "moving pictures"));
    const fs::path m_seen = directory.path() / "seen";
    tests::Program::Variables m_variables;
};

TEST_F(ATour, IsToldStepByStep)
{
    EXPECT_EQ(take(), 0) << errors;
    EXPECT_EQ(printed, "Movie     " + m_movie.native()
                           + "\n"
                             "Title     Notes and more\n"
                             "alone     \n"
                             "Pictures  in "
                           + folder.native()
                           + "\n"
                             "  1-upright.png           the start\n"
                             "  2-level.png             turned\n"
                             "Host      told that the user has finished, after save share\n");
    EXPECT_THAT(errors, IsEmpty());
}

TEST_F(ATour, NeedsNoActivity)
{
    EXPECT_EQ(take({{"FAKE_EDITOR", "finish= wait"}}), 0) << errors;
    EXPECT_THAT(printed, EndsWith("\nHost      told that the user has finished, without any activity\n"));
}

TEST_F(ATour, FailsWithoutAPictureThatWasReported)
{
    EXPECT_EQ(take({{"TOUR_PICTURES", "1-upright.png"}}), 1);
    EXPECT_THAT(printed, AllOf(HasSubstr("\n  1-upright.png           the start\n"),
                               HasSubstr("\n  2-level.png             is missing\n")));
    // Nor is an empty file one.
    EXPECT_EQ(take({{"TOUR_PICTURES", "2-level.png"}, {"TOUR_EDITOR", directory.write("empty", "")}}), 3);
    fs::resize_file(folder / "1-upright.png", 0);
    EXPECT_EQ(take({{"TOUR_PICTURES", "2-level.png"}}), 1);
    EXPECT_THAT(printed, HasSubstr("\n  1-upright.png           is missing\n"));
}

TEST_F(ATour, FailsWhenItDidNotReachItsEnd)
{
    EXPECT_EQ(take({{"TOUR_REPORT", "picture 1-upright.png the start\\n"}}), 1);
    EXPECT_THAT(printed, HasSubstr("Host      told that the user has finished"));
    EXPECT_EQ(take({{"TOUR_REPORT", ""}}), 1) << "nor does an older report count";
}

TEST_F(ATour, FailsWhenTheHostHeardNothing)
{
    EXPECT_EQ(take({{"FAKE_EDITOR", "exit=0"}}), 3);
    EXPECT_THAT(printed, EndsWith("\nHost      not told that the user has finished\n"));
    EXPECT_THAT(printed, HasSubstr("\n  2-level.png             turned\n")) << "what there is, is told";
}

TEST_F(ATour, TellsNothingOfWhatIsNoMovie)
{
    EXPECT_EQ(take({{"FAKE_EDITOR", "refuse exit=2"}}), 2);
    EXPECT_THAT(printed, IsEmpty());
}

TEST_F(ATour, GivesTheEditorAllThatAScreenWould)
{
    ASSERT_EQ(take({{"XDG_RUNTIME_DIR", directory.path()}}), 0) << errors;
    EXPECT_EQ(seen("QT_QPA_PLATFORM"), "offscreen");
    EXPECT_EQ(seen("QT_QUICK_BACKEND"), "software");
    EXPECT_EQ(seen("QT_SCALE_FACTOR"), "2");
    EXPECT_EQ(seen("CLIPSA_SCRIPT"), ":/clipsa/scripts/tour.script");
    EXPECT_EQ(seen("CLIPSA_PICTURES"), folder.native());
    EXPECT_EQ(seen("CLIPSA_REPORT"), (folder / "tour.txt").native());
    EXPECT_EQ(seen("XDG_RUNTIME_DIR"), directory.path().native());
}

TEST_F(ATour, BringsARuntimeDirectoryWhereThereIsNone)
{
    for (const std::string& none : {std::string(), (directory.path() / "none").native(), m_movie.native()}) {
        ASSERT_EQ(take({{"XDG_RUNTIME_DIR", none}}), 0) << errors;
        EXPECT_THAT(seen("XDG_RUNTIME_DIR"), StartsWith((directory.path() / "temporary/clipsa-tour-").native()));
        EXPECT_THAT(namesIn(directory.path() / "temporary"), IsEmpty()) << "it goes with the tour";
    }
}

TEST_F(ATour, SaysWhereItCannotLeaveItsPictures)
{
    directory.write("new", "a file");
    EXPECT_EQ(take(), 2);
    EXPECT_THAT(errors, StartsWith("clipsa: cannot write pictures into " + folder.native()));
    EXPECT_FALSE(fs::exists(m_seen)) << "no editor is started";
    fs::remove(directory.path() / "new");
    // A report that cannot be removed would be taken for the new one.
    fs::create_directories(folder / "tour.txt/below");
    EXPECT_EQ(take(), 2);
    EXPECT_THAT(errors, StartsWith("clipsa: cannot write pictures into " + folder.native()));
    EXPECT_FALSE(fs::exists(m_seen));
    fs::remove_all(folder / "tour.txt");
    {
        const tests::WithoutPrivileges here;
        fs::permissions(folder, fs::perms::owner_read | fs::perms::owner_exec);
        EXPECT_EQ(take(), 2);
    }
    EXPECT_THAT(errors, AllOf(StartsWith("clipsa: cannot write pictures into"), HasSubstr("that is not allowed")));
    EXPECT_FALSE(fs::exists(m_seen));
}

} // namespace
