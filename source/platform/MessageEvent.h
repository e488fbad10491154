// The events by which a host tells a thread of its own process that input for it has arrived. One a thread.
#ifndef TESSEL_PLATFORM_MESSAGEEVENT_H
#define TESSEL_PLATFORM_MESSAGEEVENT_H

#include "platform/Event.h"
#include "platform/Thread.h"

namespace tessel::platform {

// That of the calling thread, as long as the thread lives. Null when memory is short.
Event* OwnMessageEvent() noexcept;

// Signals that of a thread, which need not have asked for it yet. False with LastError: 87 for no thread of this
// process, 8 for no memory.
bool SignalMessageEvent(ThreadId thread) noexcept;

}  // namespace tessel::platform

#endif
