/// The system log with its two levels, and the console log beside it. Any thread.
#pragma once

#include <cstdio>
#include <mutex>
#include <string>
#include <string_view>
#include <vector>

namespace base {

class Log {
public:
    virtual ~Log() = default;

    /// Default level: what happens.
    virtual void message(std::string_view text) = 0;
    /// Error level: what failed.
    virtual void error(std::string_view text) = 0;
    /// The console log: details for whoever runs the program from a shell.
    virtual void console(std::string_view text) = 0;
};

/// Writes lines to a stream, what a terminal would obey made harmless, errors marked; `<3>` and `<6>` prefixes when the
/// reader is the journal.
class StreamLog final : public Log {
public:
    enum class Style { Plain, Journal };

    StreamLog(std::FILE* stream, Style style, bool verbose);

    void message(std::string_view text) override;
    void error(std::string_view text) override;
    void console(std::string_view text) override;

private:
    void write(std::string_view prefix, std::string_view text);

    std::FILE* m_stream;
    Style m_style;
    bool m_verbose;
    std::mutex m_mutex;
};

/// Keeps what was said, for tests and for the tour's summary.
class MemoryLog final : public Log {
public:
    struct Line {
        enum class Kind { Message, Error, Console } kind;
        std::string text;
        friend bool operator==(const Line&, const Line&) = default;
    };

    void message(std::string_view text) override { add(Line::Kind::Message, text); }
    void error(std::string_view text) override { add(Line::Kind::Error, text); }
    void console(std::string_view text) override { add(Line::Kind::Console, text); }

    std::vector<Line> lines() const;
    std::vector<std::string> texts(Line::Kind kind) const;
    bool contains(Line::Kind kind, std::string_view text) const;

private:
    void add(Line::Kind kind, std::string_view text);

    mutable std::mutex m_mutex;
    std::vector<Line> m_lines;
};

} // namespace base
