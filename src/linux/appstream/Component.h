/// What one source says of one application; it comes from strangers, and texts that could mislead are none. Any thread,
/// one at a time.
#pragma once

#include <memory>
#include <optional>
#include <string>
#include <string_view>

#include <appstream.h>

namespace appstream {

class Component {
public:
    using Text = std::optional<std::string>;

    /// Takes a reference of its own.
    explicit Component(AsComponent* component);

    /// In the locale that it was read for, or else as they were written. Nothing of what is empty, not UTF-8, of more than
    /// one line or too long for a name, or has characters in it that turn text around.
    Text name() const;
    Text developer() const;
    /// Only of the web.
    Text homepage() const;
    /// Where it was published, as the catalogue says; empty when it does not say.
    std::string origin() const;
    /// The one that it has in its catalogue: "org.example.App".
    std::string identifier() const;
    int priority() const;
    /// Something with windows, a terminal or a web page, not an extension, a font or a driver.
    bool isApplication() const;
    /// The reference of its Flatpak bundle; empty when it has none.
    std::string flatpakReference() const;
    /// Whether one of its custom values has a key that begins so.
    bool hasCustomKey(std::string_view prefix) const;
    /// Its categories, as menus know them.
    GPtrArray* categories() const;

private:
    std::shared_ptr<AsComponent> m_component;
};

/// An address of the web that can be shown and passed on: "http" or "https", a host, and nothing but visible ASCII.
bool isWebAddress(std::string_view text);

/// "org.example.App" of that and of "org.example.App.desktop".
std::string withoutDesktop(std::string_view identifier);

} // namespace appstream
