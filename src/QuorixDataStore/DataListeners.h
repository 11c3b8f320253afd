#pragma once

#include "notification/MultiCallback.h"

/// The callbacks of one listener path, in the order in which they are told of here, which is not
/// the order of firing. All are called by the thread that let go last of the changed state, with no
/// lock held, and are told nothing: a listener reads what it wants through a view.
///
/// Threads: adding and removing [any]. Failure: an exception of a function is logged; the functions
/// after it in the same callback do not run, everything else does.
struct VDataListeners
{
    /// A commit with changes happened, and this path's item has a proposed value that differs from
    /// its verified one. It is called again at every such commit until the two agree.
    NotificationSystem::VMultiCallback<void()> OnProposalPending;

    NotificationSystem::VMultiCallback<void()> OnVerifiedChanged; ///< a verified value was written
    NotificationSystem::VMultiCallback<void()> OnRemoved;         ///< the item was removed
    NotificationSystem::VMultiCallback<void()> OnFlagsChanged;    ///< flags were written

    /// Any of the four above was called for this path in this commit; it comes after all of them.
    NotificationSystem::VMultiCallback<void()> OnAnyChange;
};
