#include "app/editor/Script.h"

#include "app/editor/EditorProgram.h"
#include "app/editor/StartTrace.h"
#include "app/editor/SyntheticInput.h"
#include "base/Environment.h"
#include "editor/VKVideoEditorViewController.h"
#include "linux/qt/items/WorkLine.h"

#include <QFile>
#include <QGuiApplication>
#include <QImage>
#include <QQuickWindow>

#include <algorithm>
#include <cctype>
#include <cstdio>
#include <cstdlib>
#include <fstream>
#include <sstream>
#include <utility>

namespace app {

namespace {

constexpr base::Instant kRetry = std::chrono::milliseconds(5);

double number(const std::string& text)
{
    return std::strtod(text.c_str(), nullptr);
}

/// The frontmost visible view with that accessible name.
std::shared_ptr<platform::View> viewNamed(const std::shared_ptr<platform::View>& view, const std::string& name)
{
    if (view->isHidden() || view->alpha() < 0.01)
        return nullptr;
    const auto subviews = view->subviews();
    for (auto it = subviews.rbegin(); it != subviews.rend(); ++it)
        if (auto found = viewNamed(*it, name))
            return found;
    return view->accessibility().name == name ? view : nullptr;
}

/// Words from `first` up to `end`, with spaces between them.
std::string joined(const std::vector<std::string>& words, std::size_t first, std::size_t end)
{
    std::string line;
    for (std::size_t i = first; i < end; ++i)
        line += (i > first ? " " : "") + words[i];
    return line;
}

std::string seconds(double value)
{
    char text[32];
    std::snprintf(text, sizeof text, "%.3f", value);
    return text;
}

void replace(std::string& text, const std::string& from, const std::string& to)
{
    for (auto at = text.find(from); at != std::string::npos; at = text.find(from, at + to.size()))
        text.replace(at, from.size(), to);
}

} // namespace

Script::Script(EditorProgram& program, const std::string& path) : m_program(program)
{
    QFile file(QString::fromStdString(path));
    if (!file.open(QIODevice::ReadOnly)) {
        m_commands.push_back({"missing", path});
        return;
    }
    std::istringstream lines(file.readAll().toStdString());
    for (std::string line; std::getline(lines, line);) {
        std::istringstream stream(line.substr(0, line.find('#')));
        Words words;
        for (std::string word; stream >> word;)
            words.push_back(word);
        if (!words.empty())
            m_commands.push_back(std::move(words));
    }
}

Script::~Script()
{
    m_affinity.assertHere();
}

bool Script::beginsWithWaiting() const
{
    m_affinity.assertHere();
    return !m_commands.empty() && m_commands.front() == Words{"wait", "waiting"};
}

void Script::start()
{
    m_affinity.assertHere();
    m_started = true;
    next();
}

void Script::next()
{
    const auto& clock = m_program.system().clock;
    if (!m_since)
        m_since = clock.now();
    while (m_next < m_commands.size()) {
        const std::weak_ptr<bool> alive = m_alive;
        const bool done = carryOut(m_commands[m_next]);
        if (alive.expired())
            return;
        if (!done)
            break;
        ++m_next;
        m_since = clock.now();
    }
    if (m_next == m_commands.size())
        return;
    if (clock.now() - *m_since > kCommandLimit) {
        std::string line;
        for (const std::string& word : m_commands[m_next])
            line += word + " ";
        fail("the script cannot go on at: " + line);
        return;
    }
    m_program.system().mainQueue.postAfter(m_trial ? base::Instant(0) : kRetry, [this, alive = std::weak_ptr(m_alive)] {
        if (!alive.expired())
            next();
    });
}

void Script::fail(const std::string& why)
{
    m_program.system().log.error(why);
    QGuiApplication::exit(5);
    std::_Exit(5);
}

bool Script::carryOut(const Words& words)
{
    const std::string& command = words.front();
    const auto argument = [&](std::size_t i) { return i < words.size() ? words[i] : std::string(); };
    if (command == "size") {
        const QSize size(static_cast<int>(number(argument(1))), static_cast<int>(number(argument(2))));
        QQuickWindow& window = m_program.presenter().quickWindow();
        if (window.size() != size)
            window.resize(size);
        // And what the transition takes to settle.
        return m_program.window().View::bounds().size == base::Size{double(size.width()), double(size.height())}
               && m_program.system().clock.now() - *m_since > 2 * platform::Window::kTransitionDuration;
    }
    if (command == "wait" && argument(1) == "frame")
        return waitForFrame(words);
    if (command == "wait" && argument(1) == "file")
        return QFile::exists(QString::fromStdString(joined(words, 2, words.size())));
    if (command == "wait" && argument(1) == "gone")
        return !middleOf(joined(words, 2, words.size()));
    if (command == "wait")
        return waitFor(argument(1));
    if (command == "tap")
        return tap(words);
    if (command == "drag" || command == "hold")
        return drag(words);
    if (command == "lift")
        return lift();
    if (command == "key")
        return key(argument(1));
    if (command == "close") {
        m_program.presenter().quickWindow().close();
        return true;
    }
    if (command == "scheme") {
        m_program.presenter().setScheme(argument(1) == "dark" ? qtui::Scheme::Dark : qtui::Scheme::Light);
        return true;
    }
    if (command == "later") {
        m_program.clock().putAhead(number(argument(1)));
        return true;
    }
    if (command == "mark") {
        markStart(argument(1).c_str());
        return true;
    }
    if (command == "picture")
        return picture(words);
    if (command == "transitions")
        return transitions(words);
    if (command == "print") {
        print(words, 1);
        return true;
    }
    return false;
}

std::optional<base::Point> Script::middleOf(const std::string& name) const
{
    const auto view = viewNamed(m_program.window().self<platform::View>(), m_program.words().text(name));
    if (!view)
        return std::nullopt;
    return view->convertToRoot({view->bounds().width() / 2, view->bounds().height() / 2});
}

bool Script::tap(const Words& words)
{
    m_program.presenter().commit(); // nobody touches what has not been on the screen
    const bool isPlace = words.size() == 3 && std::isdigit(static_cast<unsigned char>(words[1].front())) != 0;
    const auto at =
        isPlace ? base::Point{number(words[1]), number(words[2])} : middleOf(joined(words, 1, words.size()));
    if (!at)
        return false;
    SyntheticInput input(m_program.presenter().quickWindow());
    input.press(*at);
    input.release(*at);
    return true;
}

bool Script::drag(const Words& words)
{
    constexpr int kSteps = 20;
    m_program.presenter().commit();
    std::optional<base::Point> from;
    base::Point to;
    if (words.size() == 5) {
        from = {number(words[1]), number(words[2])};
        to = {number(words[3]), number(words[4])};
    } else if (words.size() > 2) {
        from = middleOf(joined(words, 1, words.size() - 1));
        if (from)
            to = {from->x + number(words.back()), from->y};
    }
    if (!from)
        return false;
    SyntheticInput input(m_program.presenter().quickWindow());
    input.press(*from);
    for (int i = 1; i <= kSteps; ++i) {
        const double part = double(i) / kSteps;
        input.move({from->x + (to.x - from->x) * part, from->y + (to.y - from->y) * part});
    }
    m_finger = to;
    return words.front() == "hold" || lift();
}

bool Script::lift()
{
    if (!m_finger)
        return false;
    SyntheticInput(m_program.presenter().quickWindow()).release(*std::exchange(m_finger, std::nullopt));
    return true;
}

bool Script::key(const std::string& name)
{
    return SyntheticInput(m_program.presenter().quickWindow()).key(name);
}

bool Script::picture(const Words& words)
{
    m_program.presenter().commit();
    if (m_program.presenter().isAnimating())
        return false;
    const std::string folder = base::environment("CLIPSA_PICTURES");
    const std::string path = (folder.empty() ? folder : folder + "/") + words.at(1);
    if (!m_program.presenter().grab().save(QString::fromStdString(path)))
        fail("cannot write the picture " + path);
    if (words.size() > 2)
        print(words, 0);
    return true;
}

bool Script::transitions(const Words& words)
{
    if (!m_trial)
        m_trial.emplace(m_program, static_cast<int>(number(words.at(1))));
    const auto before = m_trial->count();
    const bool done = m_trial->goOn();
    if (m_trial->count() > before)
        m_since = m_program.system().clock.now(); // it takes long, but moves
    if (done) {
        report(m_trial->result());
        m_trial.reset();
    }
    return done;
}

void Script::print(const Words& words, std::size_t first) const
{
    report(filledIn(joined(words, first, words.size())));
}

std::string Script::filledIn(std::string line) const
{
    replace(line, "{memory}", std::to_string(residentKilobytes()));
    const auto editor = m_program.editor();
    if (!editor)
        return line;
    const auto frame = editor->avPlayer()->currentFrame();
    const base::Size size = editor->getVideoSize();
    replace(line, "{time}", seconds(editor->avPlayer()->currentTime().seconds()));
    replace(line, "{frame}", frame ? seconds(frame->time().seconds()) : "none");
    replace(line, "{duration}", seconds(editor->getPlayerDuration()));
    replace(line, "{size}",
            std::to_string(static_cast<int>(size.width)) + "x" + std::to_string(static_cast<int>(size.height)));
    replace(line, "{chrome}", editor->isUIHidden() ? "hidden" : "shown");
    replace(line, "{layout}", editor->isPadMode() ? "pad" : "phone");
    replace(line, "{range}", seconds(editor->editStartTime()) + "-" + seconds(editor->editEndTime()));
    const auto lines = editor->titleLabel()->subviews();
    const auto date = lines.empty() ? nullptr : std::dynamic_pointer_cast<platform::Label>(lines.front());
    replace(line, "{date}", date ? date->text() : "");
    replace(line, "{title}", editor->titleLabel()->text());
    return line;
}

void Script::report(const std::string& line) const
{
    const std::string path = base::environment("CLIPSA_REPORT");
    if (path.empty()) {
        std::printf("%s\n", line.c_str());
        std::fflush(stdout);
        return;
    }
    std::ofstream file(path, std::ios::app);
    file << line << '\n';
}

} // namespace app
