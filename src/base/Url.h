/// An address; of a file in most places. Paths are kept byte for byte, doubled slashes included.
#pragma once

#include <optional>
#include <string>
#include <string_view>

namespace base {

class Url {
public:
    static Url fromPath(std::string path);
    /// Nothing when `text` has no scheme; `file:` addresses are decoded to their path.
    static std::optional<Url> fromString(std::string_view text);

    bool isFile() const { return m_scheme == "file"; }
    /// A file's path, not percent-encoded; empty for other schemes.
    const std::string& path() const { return m_path; }
    /// The path behind its last slash.
    std::string lastPathComponent() const;
    /// The whole address, percent-encoded where it must be.
    std::string string() const;

    friend bool operator==(const Url&, const Url&) = default;

private:
    std::string m_scheme;
    std::string m_path;
    std::string m_rest; ///< what follows "scheme:" in addresses that are not files
};

} // namespace base
