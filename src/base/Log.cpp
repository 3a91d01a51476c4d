#include "base/Log.h"

#include "base/Text.h"

#include <algorithm>

namespace base {

StreamLog::StreamLog(std::FILE* stream, Style style, bool verbose)
    : m_stream(stream), m_style(style), m_verbose(verbose)
{
}

void StreamLog::message(std::string_view text)
{
    if (m_verbose || m_style == Style::Journal)
        write(m_style == Style::Journal ? "<6>" : "", text);
}

void StreamLog::error(std::string_view text)
{
    write(m_style == Style::Journal ? "<3>" : "error: ", text);
}

void StreamLog::console(std::string_view text)
{
    write(m_style == Style::Journal ? "<5>" : "", text);
}

void StreamLog::write(std::string_view prefix, std::string_view text)
{
    const std::lock_guard lock(m_mutex);
    std::fprintf(m_stream, "%.*sclipsa: %s\n", static_cast<int>(prefix.size()), prefix.data(), printable(text).c_str());
    std::fflush(m_stream);
}

std::vector<MemoryLog::Line> MemoryLog::lines() const
{
    const std::lock_guard lock(m_mutex);
    return m_lines;
}

std::vector<std::string> MemoryLog::texts(Line::Kind kind) const
{
    std::vector<std::string> found;
    for (const Line& line : lines())
        if (line.kind == kind)
            found.push_back(line.text);
    return found;
}

bool MemoryLog::contains(Line::Kind kind, std::string_view text) const
{
    const auto all = lines();
    return std::any_of(all.begin(), all.end(),
                       [&](const Line& line) { return line.kind == kind && line.text == text; });
}

void MemoryLog::add(Line::Kind kind, std::string_view text)
{
    const std::lock_guard lock(m_mutex);
    m_lines.push_back({kind, std::string(text)});
}

} // namespace base
