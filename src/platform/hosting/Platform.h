/// The roles of the platform, gathered: the app makes one of each and hands them to the system. It outlives all users.
#pragma once

#include "base/System.h"
#include "platform/device/Device.h"
#include "platform/files/Bundles.h"
#include "platform/files/DateFormatter.h"
#include "platform/files/FileManager.h"
#include "platform/files/MessageCatalog.h"
#include "platform/media/MediaFramework.h"
#include "platform/photos/PhotoLibrary.h"
#include "platform/sharing/Sharing.h"
#include "platform/storefront/StoreLookup.h"
#include "platform/views/Image.h"
#include "platform/views/Screen.h"
#include "runtime/NotificationCenter.h"

namespace platform {

struct Platform {
    const base::System& system;
    runtime::NotificationCenter& notifications;
    Device& device;
    Screen& mainScreen;
    ImageCatalog& images; ///< of the bundle that contains the program
    FileManager& files;
    Bundles& bundles;
    const MessageCatalog& words;
    Calendar& calendar;
    MediaFramework& media;
    PhotoLibrary& photos;
    StoreLookup& store;
    Sharing& sharing;
};

} // namespace platform
