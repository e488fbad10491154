// Purging of a queue by target, kind or event. Each gives the number of events dropped, 0 for a null queue.
#ifndef TESSEL_EVENTS_MGEVTQPURGE_H
#define TESSEL_EVENTS_MGEVTQPURGE_H

#include <tessel/events/MGEventQueue.h>

#ifdef __cplusplus

namespace tessel {

// What waits for the target.
TESSEL_API uint32 PurgeEventsForTarget(MGEventQueue* queue, MGEventTarget* target);

// What is of the kind.
TESSEL_API uint32 PurgeEventsOfKind(MGEventQueue* queue, int32 kind);

// What is equivalent to the event, and waits for the target (null: for any). Nothing for a null event.
TESSEL_API uint32 PurgeSpecificEvent(MGEventQueue* queue, MGEventTarget* target, MGEvent* event);

}  // namespace tessel

#endif
#endif
