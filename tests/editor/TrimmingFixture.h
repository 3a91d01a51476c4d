/// An editor whose trims end when a test says so. Main thread only.
#pragma once

#include "EditorFixture.h"

class TrimmingTest : public EditorTest {
protected:
    void confirm(double start, double end)
    {
        trimFrom(start, end);
        editor->saveAction();
    }
    std::shared_ptr<tests::FakeExportSession> session() const { return fake->media.exportSession(); }
    /// The trim ends well, with a movie that lasts `seconds`.
    void succeed(double seconds)
    {
        fake->media.movies[editor->trimFilePath()->path()] = tests::FakeMovie::lasting(seconds);
        session()->finish(platform::ExportSession::Status::Completed);
        settle();
    }
};
