/// What activities on Linux work with. It outlives them; what it refers to outlives it.
#pragma once

#include "base/System.h"
#include "base/Url.h"
#include "base/WorkList.h"
#include "linux/sharing/Outbox.h"
#include "platform/files/FileManager.h"
#include "platform/files/MessageCatalog.h"

#include <functional>
#include <string>

namespace sharing {

struct Environment {
    const base::System& system;
    const platform::MessageCatalog& words;
    const platform::FileManager& files;
    /// What is under way there keeps the process alive behind its window.
    base::WorkList& works;
    const Outbox& outbox;
    /// What the receiver sees as a file's name.
    std::function<std::string(const base::Url& file)> nameOf;
};

} // namespace sharing
