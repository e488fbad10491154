// The interrupt-safe area: where code that may take no lock notes occurrences.
#ifndef TESSEL_SOURCE_EVENTS_ASYNCAREA_H
#define TESSEL_SOURCE_EVENTS_ASYNCAREA_H

#include <tessel/events/OccurrenceManager.h>

namespace tessel {

// kMemFullErr when there is no memory.
MgErr AsyncAreaStart();
void AsyncAreaStop();

// Whether an occurrence is noted. Costs two reads.
bool AsyncAreaHasOccurrence();

// Takes what is noted out of the area, slot by slot.
class AsyncAreaWalk {
public:
    AsyncAreaWalk() : slot_(AsyncAreaHasOccurrence() ? 0 : kNumOccurAsyncSlots) {}

    // The next one; 0 when there is none left.
    Occurrence Next();

private:
    int slot_;
    bool tookSome_ = false;  // since it began with the first slot
};

}  // namespace tessel

#endif
