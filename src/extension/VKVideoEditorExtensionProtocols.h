/// What travels between the extension and its host: the payload's keys, and the two protocols of the connection.
#pragma once

#include "editor/VKVideoEditorViewController.h"
#include "platform/hosting/Connection.h"

#include <memory>

// Titles of the payload's items: one item a value, the value as its first attachment. Compared exactly.

/// A path, required. The name says path and the text says URL: hosts must use the text.
inline constexpr const char* VKVideoEditorExtensionMoviePathKey = "VKVideoEditorExtensionMovieURLKey";
/// The recorded app's display name, required.
inline constexpr const char* VKVideoEditorExtensionAppNameKey = "VKVideoEditorExtensionAppNameKey";
/// The recorded app's bundle identifier, required.
inline constexpr const char* VKVideoEditorExtensionBundleIdentifierKey = "VKVideoEditorExtensionBundleIdentifierKey";
/// The path of an extra file to share with the movie.
inline constexpr const char* VKVideoEditorExtensionFileAttachmentKey = "VKVideoEditorExtensionFileAttachmentKey";
/// Text that replaces the default share message.
inline constexpr const char* VKVideoEditorExtensionOverrideShareMessageKey =
    "VKVideoEditorExtensionOverrideShareMessageKey";
/// A colour: the top bar's tint.
inline constexpr const char* VKVideoEditorExtensionOverrideTintColorKey = "VKVideoEditorExtensionOverrideTintColorKey";

/// What the extension offers its host: nothing yet.
class VKVideoEditorExtensionProtocol {
public:
    static platform::ConnectionInterface connectionInterface();

protected:
    ~VKVideoEditorExtensionProtocol() = default;
};

/// What the host offers the extension.
class VKVideoEditorExtensionHostProtocol {
public:
    static platform::ConnectionInterface connectionInterface();

    virtual ~VKVideoEditorExtensionHostProtocol() = default;
    /// One way: the user is done, and completed these activities in this order.
    virtual void extensionDidFinishWithActivityTypes(const std::shared_ptr<ActivityTypes>& activityTypes) = 0;
};
