// Whether 8-byte atomics run in hardware: decided at start, false before.
#ifndef TESSEL_SOURCE_SYNC_PROTECTEDATOMICOPERATIONS_H
#define TESSEL_SOURCE_SYNC_PROTECTEDATOMICOPERATIONS_H

namespace tessel {

bool AtomicsInHardware();
void SetAtomicsInHardware(bool on);  // for start, and for tests of both ways

}  // namespace tessel

#endif
