/// What assistive technology sees of work that is under way: a progress bar of the window. GUI thread.
#pragma once

class QAccessibleInterface;

namespace qtui {

class WorkLine;

/// For Qt's factory, which owns it.
QAccessibleInterface* makeWorkAccessible(WorkLine& line);

/// Tell who listens. Nothing when nobody does.
void announceWorkBegun(WorkLine& line);
void announceWorkProgress(WorkLine& line);
void announceWorkEnded(WorkLine& line);

} // namespace qtui
