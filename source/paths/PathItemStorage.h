// Where path elements live: blocks of slots, the table of the bases, and the standard locations.
#ifndef TESSEL_SOURCE_PATHS_PATHITEMSTORAGE_H
#define TESSEL_SOURCE_PATHS_PATHITEMSTORAGE_H

#include <tessel/paths/PathRef.h>

namespace tessel {

class PathItemElement;

// The storage mutex guards the list of blocks, the claiming of slots and the standard locations. It is taken inside the
// path mutex, and nothing is taken inside it.
class PathItemStorage {
public:
    static MgErr Start();
    // Frees the blocks. One that holds live elements is reported, and kept for those who still point there.
    static void Stop();

    // A claimed slot, or null when there is no memory.
    static PathItemElement* Allocate();
    static void SlotVacated(const PathItemElement* element);

    // Whether the address is that of a slot. Takes no lock; the address may be anything.
    static bool Owns(const PathItemElement* element);

    // The bases: a base keeps its element retained. SetStandard is for start-up.
    static void SetStandard(PathRef::PathBase base, PathItemElement* element);
    static PathItemElement* Standard(PathRef::PathBase base);

    // The standard locations, each of which keeps its element retained. Find retains for the caller; null: unknown.
    static MgErr AddLocation(const char* name, PathItemElement* element);
    static PathItemElement* FindLocation(const char* name);
    static void ForgetLocations();

    static uint32 GarbageCollect(PathRef::OptimizationMethod method);
};

}  // namespace tessel

#endif
