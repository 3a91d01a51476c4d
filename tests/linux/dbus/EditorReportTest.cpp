// What became of movies, as an editor tells it and its host reads it.
#include "linux/dbus/EditorReport.h"

#include <gmock/gmock.h>

#include <fcntl.h>
#include <sys/wait.h>
#include <unistd.h>

using testing::IsEmpty;
using testing::SizeIs;

namespace {

using Kind = dbus::MovieNote::Kind;

class AnEditorsReport : public ::testing::Test {
protected:
    AnEditorsReport()
        : host(std::move(dbus::EditorReport::make()).value()), editor(posix::FileDescriptor(::dup(host.descriptor())))
    {
    }

    dbus::EditorReport host;
    dbus::EditorReport editor;
};

TEST_F(AnEditorsReport, IsReadInOrderWhileItIsWritten)
{
    EXPECT_THAT(host.notes(), IsEmpty());
    editor.add({Kind::Saved, "/videos/a.mp4", ""});
    ASSERT_THAT(host.notes(), SizeIs(1));
    editor.add({Kind::Unsaved, "/unsaved/b\n.mp4", "the disk is full"});
    editor.add({Kind::Refused, "", "nothing helps"});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(3));
    EXPECT_EQ(notes[0].kind, Kind::Saved);
    EXPECT_EQ(notes[0].path, "/videos/a.mp4");
    EXPECT_EQ(notes[1].kind, Kind::Unsaved);
    EXPECT_EQ(notes[1].path, "/unsaved/b\n.mp4");
    EXPECT_EQ(notes[1].why, "the disk is full");
    EXPECT_EQ(notes[2].kind, Kind::Refused);
    EXPECT_EQ(notes[2].path, "");
}

TEST_F(AnEditorsReport, CountsNoHalfEntry)
{
    editor.add({Kind::Saved, "/videos/a.mp4", ""});
    ASSERT_EQ(::write(editor.descriptor(), "saved\0/videos/b", 15), 15);
    EXPECT_THAT(host.notes(), SizeIs(1));
}

TEST_F(AnEditorsReport, EndsATextWhereAZeroByteWouldEndIt)
{
    editor.add({Kind::Saved, std::string("/videos/a\0.mp4", 14), ""});
    editor.add({Kind::Unsaved, "/videos/b.mp4", ""});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(2));
    EXPECT_EQ(notes[0].path, "/videos/a");
    EXPECT_EQ(notes[1].path, "/videos/b.mp4");
}

TEST_F(AnEditorsReport, IsReadToItsEnd)
{
    for (int i = 0; i < 1000; ++i)
        editor.add({Kind::Saved, "/videos/" + std::to_string(i) + ".mp4", ""});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(1000));
    EXPECT_EQ(notes.back().path, "/videos/999.mp4");
}

TEST_F(AnEditorsReport, IsReadToItsLastByte)
{
    // One byte more than is read at once.
    editor.add({Kind::Saved, "/" + std::string(4097 - 9, 'x'), ""});
    EXPECT_THAT(host.notes(), SizeIs(1));
}

TEST_F(AnEditorsReport, IsNotReadFurtherThanAnybodySaves)
{
    // Each takes 4 KiB, of the mebibyte that is read.
    for (int i = 0; i < 300; ++i)
        editor.add({Kind::Saved, "/" + std::string(4096 - 9, 'x'), ""});
    EXPECT_THAT(host.notes(), SizeIs(256));
}

TEST_F(AnEditorsReport, MayTellWhatThisHostDoesNotKnow)
{
    ASSERT_EQ(::write(editor.descriptor(), "printed\0/a\0", 12), 12);
    editor.add({Kind::Saved, "/videos/a.mp4", ""});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(1));
    EXPECT_EQ(notes[0].path, "/videos/a.mp4");
}

TEST_F(AnEditorsReport, TellsWithWhomSomethingWasShared)
{
    editor.add({.kind = Kind::Shared, .type = "Bluetooth", .receiver = "Anna’s\nphone"});
    editor.add({.kind = Kind::Unshared, .why = "it went\naway", .type = "KDEConnect", .receiver = "Tablet"});
    editor.add({.kind = Kind::Shared});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(3));
    EXPECT_EQ(notes[0].kind, Kind::Shared);
    EXPECT_EQ(notes[0].type, "Bluetooth");
    EXPECT_EQ(notes[0].receiver, "Anna’s\nphone");
    EXPECT_EQ(notes[0].why, "");
    EXPECT_EQ(notes[0].path, "") << "it is no movie's place";
    EXPECT_EQ(notes[1].kind, Kind::Unshared);
    EXPECT_EQ(notes[1].type, "KDEConnect");
    EXPECT_EQ(notes[1].receiver, "Tablet");
    EXPECT_EQ(notes[1].why, "it went\naway");
    EXPECT_EQ(notes[2].type + notes[2].receiver + notes[2].why, "");
}

TEST_F(AnEditorsReport, IsPassedOverWhereAHostKnowsNoShares)
{
    editor.add({.kind = Kind::Unshared, .why = "b", .type = "c", .receiver = "d"});
    std::string bytes(64, '\0');
    bytes.resize(static_cast<std::size_t>(::pread(host.descriptor(), bytes.data(), bytes.size(), 0)));
    EXPECT_EQ(bytes, std::string("unshared\0d\0c\nb\0", 15)) << "three texts, as every entry has";
}

TEST_F(AnEditorsReport, TakesNoTextForMoreThanOne)
{
    editor.add({.kind = Kind::Unshared,
                .why = std::string("why\0saved", 9),
                .type = "Mail\nsaved",
                .receiver = std::string("a\0b", 3)});
    editor.add({.kind = Kind::Shared, .type = std::string("a\0b\nc", 5), .receiver = "d"});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(2));
    EXPECT_EQ(notes[0].type, "Mail");
    EXPECT_EQ(notes[0].receiver, "a");
    EXPECT_EQ(notes[0].why, "why");
    EXPECT_EQ(notes[1].type, "a");
}

TEST_F(AnEditorsReport, ShortensWhatIsLongerThanATextMayBe)
{
    const std::string most(dbus::EditorReport::kLongestText, 'x');
    editor.add({.kind = Kind::Unshared, .why = most + "y", .type = most + "y", .receiver = most});
    editor.add({Kind::Unsaved, most.substr(1) + "€", most.substr(3) + "€"});
    editor.add({Kind::Saved, std::string(std::size_t{1024} * 1024, '\x80')});
    const auto notes = host.notes();
    ASSERT_THAT(notes, SizeIs(3));
    EXPECT_EQ(notes[0].why, most);
    EXPECT_EQ(notes[0].type, most);
    EXPECT_EQ(notes[0].receiver, most);
    EXPECT_EQ(notes[1].path, most.substr(1)) << "not within a character";
    EXPECT_EQ(notes[1].why, most.substr(3) + "€") << "it fits";
    EXPECT_EQ(notes[2].path, "") << "there is no character to end at";
}

TEST_F(AnEditorsReport, MovesAsideForTheNumbersThatEditorsInherit)
{
    // In a process of its own, where these numbers are free.
    const pid_t child = ::fork();
    if (child == 0) {
        for (int number = 3; number < 16; ++number)
            ::close(number);
        const auto report = dbus::EditorReport::make();
        ::_exit(report && report.value().descriptor() > dbus::kEditorReportDescriptor ? 0 : 1);
    }
    int status = -1;
    ASSERT_EQ(::waitpid(child, &status, 0), child);
    EXPECT_EQ(status, 0);
    EXPECT_TRUE(::fcntl(host.descriptor(), F_GETFD) & FD_CLOEXEC) << "others inherit it as well";
}

} // namespace
