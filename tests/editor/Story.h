/// What an editor does, step by step: each call that it makes of its platform, and between them what had changed by then.
/// Where something changed on the screen, what had changed is told there and then. Main thread only.
///
///     Story story(*fake, editor);
///     editor->pauseAction();
///     EXPECT_THAT(story.end(), ElementsAre("pause", "bottom: share _ play _"));
#pragma once

#include "editor/VKVideoEditorViewController.h"
#include "support/FakePlatform.h"

#include <map>
#include <memory>
#include <string>
#include <vector>

class Story {
public:
    using EditorRef = std::shared_ptr<VKVideoEditorViewController>;

    /// Listens from now on, also to an editor that is not there yet, or any more.
    Story(tests::FakePlatform& fake, const EditorRef& editor);
    ~Story();
    Story(const Story&) = delete;
    Story& operator=(const Story&) = delete;

    /// Listens no longer. Gives what happened.
    std::vector<std::string> end();

private:
    using State = std::map<std::string, std::string>; ///< what can be seen from outside, by its name

    State state() const;
    void addEditor(State& state) const;
    std::string items(const platform::Toolbar& bar) const;
    void heard(const std::string& call);
    /// The editor's task; not one that a fake has posted for itself.
    void queued();
    /// Tells what has changed since it was last told.
    void tellChanges();

    tests::FakePlatform& m_fake;
    const EditorRef& m_editor;
    State m_told;
    std::size_t m_linesTold = 0;
    std::vector<std::string> m_story;
};
