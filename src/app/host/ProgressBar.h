/// A line on a terminal that tells how far work has come; nothing where the stream is no terminal. One thread.
/// The stream has no buffer, as that for errors.
#pragma once

#include "base/Affinity.h"

#include <cstdio>
#include <string>

namespace host {

/// "what [####----]  50 %", no wider than `columns`, which it fills up to a readable width. Plain ASCII besides `what`.
/// `part` is from 0 to 1; what lies outside is the nearer end, and what is not a number is 0.
std::string progressLine(const std::string& what, double part, int columns);

class ProgressBar {
public:
    explicit ProgressBar(std::string what, std::FILE* stream = stderr);
    /// Takes the line away.
    ~ProgressBar();
    ProgressBar(const ProgressBar&) = delete;
    ProgressBar& operator=(const ProgressBar&) = delete;

    /// Draws when something has changed.
    void show(double part);
    /// Before anything else is printed.
    void clear();

private:
    base::Affinity m_affinity;
    const std::string m_what;
    std::FILE* const m_stream;
    const bool m_isTerminal;
    std::string m_shown;
};

} // namespace host
