// Whether new trackers track.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKING_H
#define TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKING_H

namespace tessel {

// On, unless OV_ALLOC_TRACKER=off stood in the environment or among the arguments of the process when it was first
// asked, or it was turned off.
bool IsAllocTrackingOn();
void SetAllocTracking(bool on);

}  // namespace tessel

#endif
