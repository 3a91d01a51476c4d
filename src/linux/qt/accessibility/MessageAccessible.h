/// What assistive technology sees of what is said over a picture or in place of one: a message of the window. GUI thread.
#pragma once

class QAccessibleInterface;

namespace qtui {

class VideoItem;

/// For Qt's factory, which owns it.
QAccessibleInterface* makeMessageAccessible(VideoItem& item);

} // namespace qtui
