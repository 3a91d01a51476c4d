/// The options that come with a call on the session bus, put into a request. Any thread; this layer's own business.
#pragma once

#include "base/Result.h"
#include "linux/dbus/EditRequest.h"

#include <QVariantMap>

namespace dbus {

/// An option of the wrong type, or a tint that is no colour, is an error that names it; what is not known is left out,
/// so that a recorder can be newer than we are.
base::Result<void> takeOptions(const QVariantMap& options, EditRequest& request);

/// What a desktop passes along with a request to show something: the right to take the focus.
void takePlatformData(const QVariantMap& data, EditRequest& request);

/// A duplicate of a descriptor that came with a message; empty when there is none.
posix::FileDescriptor descriptorFrom(const QVariant& value);

} // namespace dbus
