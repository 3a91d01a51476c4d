/// The process of one editor: started, watched, and in the end made to go. Lives on one thread, whose Qt event loop
/// runs; the handler is called there.
#pragma once

#include "base/Affinity.h"
#include "base/Result.h"

#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <utility>
#include <vector>

namespace host {

/// How a process ended: an exit status, or the signal that ended it.
struct ProcessEnd {
    int exitStatus = 0;
    int signal = 0;

    /// "with exit status 7", "by signal 11 (Segmentation fault)".
    std::string words() const;
};

struct ProcessStart {
    std::string program;
    std::vector<std::string> arguments;
    std::vector<std::pair<std::string, std::string>> environment; ///< added to ours
    // Nothing but these is inherited, and the standard streams.
    std::optional<int> lock = {};   ///< as dbus::kEditorLockDescriptor
    std::optional<int> report = {}; ///< as dbus::kEditorReportDescriptor; its own number is higher
};

class EditorProcess {
public:
    /// In a process group of its own, so that Ctrl+C reaches us and not the editor; reads nothing, and writes to our
    /// standard error only. `ended` is called once.
    static base::Result<std::unique_ptr<EditorProcess>> start(const ProcessStart& start,
                                                              std::function<void(ProcessEnd)> ended);
    /// Kills a process that still runs, and waits for it.
    ~EditorProcess();

    /// Does nothing once it has ended.
    void signal(int number);

private:
    struct State;

    explicit EditorProcess(std::unique_ptr<State> state);

    std::unique_ptr<State> m_state;
    base::Affinity m_affinity;
};

/// The editor's program: what CLIPSA_EDITOR names, else `clipsa-editor` beside our own program, in ../libexec/clipsa,
/// or on PATH.
base::Result<std::string> findEditorProgram();

} // namespace host
