#include "Story.h"

#include <set>
#include <sstream>
#include <utility>

namespace {

std::string words(bool value)
{
    return value ? "yes" : "no";
}

std::string words(const std::optional<base::Url>& url)
{
    return url ? url->path() : "none";
}

std::string words(const base::Rect& rect)
{
    std::ostringstream text;
    text << rect.minX() << "," << rect.minY() << " " << rect.width() << "x" << rect.height();
    return text.str();
}

std::string words(double number)
{
    std::ostringstream text;
    text << number;
    return text.str();
}

} // namespace

Story::Story(tests::FakePlatform& fake, const EditorRef& editor) : m_fake(fake), m_editor(editor)
{
    m_fake.window->commit();
    m_told = state();
    m_linesTold = m_fake.machine.log.lines().size();
    const auto hear = [this](const std::string& call) { heard(call); };
    m_fake.media.listener->heard = hear;
    m_fake.files.listener->heard = hear;
    m_fake.photos.listener->heard = hear;
    m_fake.machine.mainQueue.setWake([this] { queued(); });
    m_fake.window->setNeedsCommitHandler([this] {
        tellChanges();
        m_fake.window->commit(); // it is told once until then
    });
}

Story::~Story()
{
    end();
}

std::vector<std::string> Story::end()
{
    if (m_fake.media.listener->heard)
        tellChanges();
    m_fake.media.listener->heard = {};
    m_fake.files.listener->heard = {};
    m_fake.photos.listener->heard = {};
    m_fake.machine.mainQueue.setWake({});
    m_fake.window->setNeedsCommitHandler({});
    return std::move(m_story);
}

void Story::heard(const std::string& call)
{
    tellChanges();
    m_story.push_back(call);
}

void Story::queued()
{
    static const std::set<std::string> kWithTasksOfTheirOwn{"seek", "step", "asset", "item"};
    const std::size_t before = m_story.size();
    tellChanges();
    const std::string last = before > 0 && before == m_story.size() ? m_story.back() : "";
    if (!kWithTasksOfTheirOwn.contains(last.substr(0, last.find(' '))))
        m_story.emplace_back("queued");
}

void Story::tellChanges()
{
    const auto lines = m_fake.machine.log.lines();
    for (; m_linesTold < lines.size(); ++m_linesTold)
        m_story.push_back("log: " + lines[m_linesTold].text);
    const State now = state();
    for (const auto& [name, value] : now)
        if (const auto told = m_told.find(name); told == m_told.end() || told->second != value)
            m_story.push_back(name + ": " + value);
    m_told = now;
}

Story::State Story::state() const
{
    State state;
    const auto item = m_fake.media.item();
    state["observers"] = std::to_string(item ? item->observerCount() : 0);
    state["registered"] = std::to_string(m_fake.notifications.registrationCount());
    state["files' work"] = std::to_string(m_fake.machine.backgroundQueue.pending());
    if (m_editor)
        addEditor(state);
    return state;
}

void Story::addEditor(State& state) const
{
    VKVideoEditorViewController& editor = *m_editor;
    state["loaded"] = words(editor.currentItemLoaded());
    state["exporting"] = words(editor.isExporting());
    state["scrubbing"] = words(editor.isScrubbing());
    state["trimming"] = words(editor.isTrimming());
    state["one bar"] = words(editor.isPadMode());
    state["intro"] = words(editor.isIntroMode());
    state["hidden"] = words(editor.isUIHidden());
    state["edited"] = words(editor.hasEdit());
    state["start"] = words(editor.editStartTime());
    state["end"] = words(editor.editEndTime());
    state["movie"] = words(editor.videoURL());
    state["trim to"] = words(editor.trimFilePath());
    state["done"] = std::to_string(editor.activityTypes()->size());
    state["top"] = items(*editor.topToolBar());
    state["bottom"] = items(*editor.bottomToolBar());
    state["bottom bar"] = editor.bottomToolBar()->superview() ? "shown" : "away";
    state["top frame"] = words(editor.topToolBar()->frame());
    state["bottom frame"] = words(editor.bottomToolBar()->frame());
    state["picture frame"] = words(editor.avPlayerLayer()->frame());
    const double alpha = editor.topToolBar()->alpha();
    state["bars"] = alpha == 0 ? "faded" : alpha == 1 ? "seen" : "between";
    const auto button = editor.videoOverlayPlayButton()->asView();
    state["large button"] = button->superview() ? words(button->frame()) : "away";
    state["insets"] = words(editor.playButton()->imageInsets().top) + " "
                      + words(editor.pauseButton()->imageInsets().top) + " "
                      + words(editor.shareButton()->imageInsets().top);
    state["handles"] = words(editor.avTrimmer()->isEditing());
    state["asked"] =
        words(editor.avTrimmer()->delegate() == m_editor) + " " + words(editor.avTrimmer()->dataSource() == m_editor);
    state["pictures"] =
        words(editor.thumbnailGenerator() != nullptr) + " " + words(editor.cachedTimeStamps() != nullptr);
    std::string rests = "on nothing";
    for (const auto& constraint : editor.view()->constraints())
        if (constraint.firstAttribute == platform::LayoutAttribute::Bottom)
            rests = constraint.second.lock() == editor.view() ? "on the edge" : "on the bar";
    state["strip"] = rests;
}

std::string Story::items(const platform::Toolbar& bar) const
{
    const VKVideoEditorViewController& editor = *m_editor;
    const std::map<std::shared_ptr<platform::BarButtonItem>, std::string> names{
        {editor.shareButton(), "share"},   {editor.undoButton(), "undo"},     {editor.pauseButton(), "pause"},
        {editor.playButton(), "play"},     {editor.doneButton(), "done"},     {editor.saveButton(), "save"},
        {editor.cancelButton(), "cancel"}, {editor.cancelTrimButton(), "no"}, {editor.trimButton(), "trim"},
        {editor.titleButton(), "title"},   {editor.flexSpace(), "_"},         {editor.fixSpace(), "."},
    };
    std::string text;
    for (const auto& item : bar.items())
        text += (text.empty() ? "" : " ") + (names.contains(item) ? names.at(item) : "?");
    return text.empty() ? "empty" : text;
}
