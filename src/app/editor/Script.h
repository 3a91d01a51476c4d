/// Does to the editor what a person would, by a script: for the guided tour, and for tests of the whole program.
///
/// A script is a text file, one command a line, `#` for comments:
///   size W H               resize the window, in points
///   wait waiting           first of all: begin while the window waits for the recording
///   wait busy              until the window shows that something is under way
///   wait picture|ready     until the movie's first picture is shown; until its item is ready (or failed)
///   wait hidden|shown      until the chrome has faded out or in
///   wait thumbnails        until the strip has all its pictures
///   wait zoomed            until the strip shows the moments around a grip that is held still
///   wait trimming|trimmed  until trim mode is on; until it is off and the movie then shown is ready
///   wait sheet|alert|editor  until the share sheet is all there; until an alert comes above it; until nothing stands
///                          above the editor any more
///   wait still             until nothing moves or fades
///   wait gone NAME         until no control of that name can be seen
///   wait frame [SECONDS]   until the picture of the present time is on the screen (the one that does not change any
///                          more, where the recording stands still), or that of SECONDS or a later one
///   wait fine              until that picture is as fine as the recording's: one that is dragged past is not at first
///   wait file PATH         until that file is there
///   tap NAME  |  tap X Y   touch a control by its accessible name, or a place in points;
///                          a key of the program's words stands for the name in every language
///   drag X1 Y1 X2 Y2       touch, move in small steps, lift
///   drag NAME DX           the same from a control's middle, DX points to the right
///   hold …                 the same without lifting; `lift` does that
///   key NAME               space, escape, return, left, right, home, end, tab, comma, period, undo, i, o
///   close                  ask the window to close, as its title bar does
///   scheme light|dark
///   later SECONDS          put the calendar ahead
///   mark NAME              tell the time of that moment, for ./bench: see StartTrace.h
///   picture FILE [WORDS]   once nothing moves or fades, write what is on the screen as a PNG, into $CLIPSA_PICTURES or
///                          here; with WORDS, say so
///   print WORDS            a line at the end of the file $CLIPSA_REPORT, or on standard output; filled in are {time},
///                          {frame} (the shown picture's time), {duration}, {size}, {title}, {date}, {chrome},
///                          {layout} (phone or pad), {range} (START-END of trim mode), {memory} (resident, in kB)
///   transitions N          change the size N times, without waiting for it to settle; report what the first and the
///                          last hundred took, and the memory
/// A command that cannot be carried out within ten seconds ends the process with status 5. GUI thread.
#pragma once

#include "app/editor/TransitionTrial.h"
#include "base/Affinity.h"
#include "base/Clock.h"
#include "base/Geometry.h"
#include "platform/media/VideoFrame.h"

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace app {

class EditorProgram;

class Script {
public:
    static constexpr base::Instant kCommandLimit = std::chrono::seconds(10);

    Script(EditorProgram& program, const std::string& path);
    ~Script();

    /// Whether it is for the window that waits for the recording.
    bool beginsWithWaiting() const;
    void start();
    bool hasStarted() const
    {
        m_affinity.assertHere();
        return m_started;
    }

private:
    using Words = std::vector<std::string>;

    /// Whether the command is done; if not, it is tried again a little later.
    bool carryOut(const Words& words);
    bool waitFor(const std::string& what);
    bool waitForFrame(const Words& words);
    std::optional<base::Point> middleOf(const std::string& name) const;
    bool tap(const Words& words);
    bool drag(const Words& words);
    bool lift();
    bool key(const std::string& name);
    bool picture(const Words& words);
    bool transitions(const Words& words);
    void print(const Words& words, std::size_t first) const;
    std::string filledIn(std::string line) const;
    void report(const std::string& line) const;
    void next();
    void fail(const std::string& why);

    EditorProgram& m_program;
    std::vector<Words> m_commands;
    std::size_t m_next = 0;
    bool m_started = false;
    std::optional<base::Instant> m_since;
    std::optional<TransitionTrial> m_trial;
    std::weak_ptr<const platform::VideoFrame> m_waitedFrame; ///< what is there while `wait frame` waits…
    base::Instant m_waitedSince{};                           ///< …and since when
    bool m_wasAlone = false;                                 ///< the editor, at the last look
    std::optional<base::Point> m_finger;                     ///< where it is held
    std::shared_ptr<bool> m_alive = std::make_shared<bool>(true);
    base::Affinity m_affinity;
};

} // namespace app
