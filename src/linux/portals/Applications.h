/// What the installed applications say of themselves, as far as sharing needs it. Any thread; reads many small files.
#pragma once

#include <optional>
#include <string>
#include <vector>

namespace portals {

/// Where applications and their associations are, the most important first.
struct ApplicationDirectories {
    std::vector<std::string> configuration;
    std::vector<std::string> data;
    std::vector<std::string> programs;

    static ApplicationDirectories ofUser();
};

/// Its desktop entry lists this among the interfaces that it implements: it takes files, and asks who is to get them in a
/// message. See docs/for-applications.md.
inline constexpr const char* kMessageComposer = "org.clipsa.MessageComposer1";

struct Application {
    std::string identifier; ///< without ".desktop"
    std::string name;       ///< in the user's language
    std::string entry;      ///< the path of its desktop entry
    std::string command;    ///< as it stands there; empty where it is started by the bus
    std::string program;    ///< the path of what that starts
};

/// Those that send files in messages, by name.
std::vector<Application> messageApplications(const ApplicationDirectories& directories);

/// The words that start `application` with the file at `path`; none when its command says nothing that can be started.
std::vector<std::string> commandFor(const Application& application, const std::string& path);

/// The path of xdg-email, where it is installed and some application opens addresses of mails.
std::optional<std::string> mailProgram(const ApplicationDirectories& directories);

} // namespace portals
