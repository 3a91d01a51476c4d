// What leaves the editor: where movies go, what they are called there, and what the host is told of it.

#include "app/editor/EditorProgram.h"

#include "app/editor/MovieThumbnail.h"
#include "editor/VKVideoEditorViewController.h"
#include "linux/photos/LibraryName.h"
#include "support/VKFileManagerExtensions.h"

#include <QGuiApplication>
#include <QQuickWindow>

#include <filesystem>
#include <string>

namespace app {

namespace {

/// Dialogues of the desktop stand before it. Only X11 has a name for a window that others understand without being asked.
std::string windowForPortals(const QWindow& window)
{
    if (QGuiApplication::platformName() != "xcb")
        return {};
    return "x11:" + QString::number(window.winId(), 16).toStdString();
}

} // namespace

/// The library names the movie after the app and the date of the recording as it came.
void EditorProgram::learnAboutRecording()
{
    const auto current = editor();
    if (!current || !current->originalVideoURL())
        return;
    const auto created = VKExtensions::_srGetCreationDateForFile(m_files, *current->originalVideoURL());
    if (created)
        m_recording.setValue({current->applicationName().value_or(""), created});
}

ShareServices::Options EditorProgram::sharingOptions()
{
    return {m_system,
            m_words,
            m_files,
            m_works,
            m_photos,
            [this](const base::Url& file) { return nameOf(file); },
            [this] { return windowForPortals(m_presenter.quickWindow()); },
            [this](const platform::Activity& activity, const platform::Activity::End& end) {
                reportShared(activity, end);
            }};
}

/// Receivers see the recording under the name that the library would give it.
std::string EditorProgram::nameOf(const base::Url& file) const
{
    const auto current = editor();
    if (current && current->fileAttachmentURL() == file)
        return file.lastPathComponent();
    const photos::Recording recording = m_recording.value();
    const std::string path = m_files.resolvedPath(file.path());
    const base::Date date = recording.date.value_or(m_clock.date());
    return photos::libraryName(recording.appName, date, path).numbered(1);
}

void EditorProgram::reportShared(const platform::Activity& activity, const platform::Activity::End& end)
{
    using Kind = dbus::MovieNote::Kind;
    if (end.completed)
        m_report.add({.kind = Kind::Shared, .type = activity.activityType(), .receiver = activity.receiver()});
    else if (end.error)
        m_report.add({.kind = Kind::Unshared,
                      .why = end.error->description(),
                      .type = activity.activityType(),
                      .receiver = activity.receiver()});
}

photos::LibraryOptions EditorProgram::libraryOptions()
{
    photos::LibraryOptions options;
    options.directories = photos::UserDirectories::ofUser();
    options.resolvedPath = [this](const std::string& path) { return m_files.resolvedPath(path); };
    options.recording = [this](const std::string&) { return m_recording.value(); };
    options.thumbnail = [this](const std::string& path, int side) {
        return movieThumbnail(m_mainQueue, m_media, path, side);
    };
    options.published = [this](const std::string& path) { m_report.add({dbus::MovieNote::Kind::Saved, path, {}}); };
    // A save ends the editor, whose end empties the store: what could not be saved must be elsewhere by then. Beside
    // the store there is always a way, as it needs no room there.
    options.unsavedDirectories = {options.directories.unsaved,
                                  std::filesystem::path(m_options.deviceRoot).parent_path().parent_path() / "unsaved"};
    options.unsaved = [this](const base::ErrorRef& why, const base::Result<std::string>& kept) {
        const std::string words = why->description();
        m_report.add({dbus::MovieNote::Kind::Unsaved, kept.valueOr({}),
                      kept ? words : words + "; " + kept.error()->description()});
    };
    return options;
}

} // namespace app
