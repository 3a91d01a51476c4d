// What became of saved notes, as an editor tells it and its host reads it.
#include "linux/dbus/EditorReport.h"

#include <gmock/gmock.h>

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

TEST_F(AnEditorsReport, MovesAsideForTheNumbersThatEditorsInherit)
{
    EXPECT_GT(host.descriptor(), dbus::kEditorReportDescriptor);
}

} // namespace
