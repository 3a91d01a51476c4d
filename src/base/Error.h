/// What went wrong, as an object: a domain, a code within it, and words for the reader.
/// Immutable and shared; may be passed between threads.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <string>

namespace base {

class Error;

/// A shared, immutable error; null means success.
using ErrorRef = std::shared_ptr<const Error>;

class Error {
public:
    using UserInfo = std::map<std::string, std::string>;

    /// The user-info key under which `description()` looks first.
    static constexpr const char* kDescriptionKey = "description";

    Error(std::string domain, std::int64_t code, UserInfo userInfo = {});

    /// The user-info key of a message for people in their own language: what its table calls it. The other entries fill its
    /// places, by name.
    static constexpr const char* kMessageKey = "message";

    /// The usual way to make one: code for the caller, `description` for the reader.
    static ErrorRef make(std::string domain, std::int64_t code, std::string description);

    /// The same error, with a message for people beside its description.
    static ErrorRef withMessage(const ErrorRef& error, std::string key, UserInfo places);

    /// An error of the operating system (`errno`), with what was being done to which file. Its description
    /// goes on with what that number means, in plain words.
    static ErrorRef fromErrno(int number, const std::string& doing);

    /// What an error number comes to for somebody who uses a computer and does not program it; begins in lower case and
    /// has no full stop.
    static std::string meaningOf(int number);

    const std::string& domain() const { return m_domain; }
    std::int64_t code() const { return m_code; }
    const UserInfo& userInfo() const { return m_userInfo; }

    /// The code as log lines print it: its low 32 bits, signed.
    std::int32_t code32() const { return static_cast<std::int32_t>(m_code); }

    /// Words for a person; domain and code when no words were given.
    std::string description() const;

private:
    std::string m_domain;
    std::int64_t m_code;
    UserInfo m_userInfo;
};

/// The domain of `Error::fromErrno`.
inline constexpr const char* kPosixErrorDomain = "posix";

} // namespace base
