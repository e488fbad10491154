#include "events/OccurrenceLocks.h"

#include <cstdlib>

namespace tessel {

constinit OccurrenceLock gTimerOccMutex(0);
constinit OccurrenceLock gOccMutex(1);
constinit OccurrenceLock gTimedHdlrMutex(2);

namespace {

thread_local unsigned heldRanks = 0;

}  // namespace

unsigned OccurrenceLock::HeldRanks() {
    return heldRanks;
}

void OccurrenceLock::NoteAcquired(int rank) {
    if (heldRanks >> rank) std::abort();  // this one, or one that comes after it
    heldRanks |= 1u << rank;
}

void OccurrenceLock::NoteReleased(int rank) {
    heldRanks &= ~(1u << rank);
}

}  // namespace tessel
