// Whether new trackers track.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKING_H
#define TESSEL_SOURCE_DIAGNOSTICS_ALLOCTRACKING_H

namespace tessel {

// On, unless the environment variable OV_ALLOC_TRACKER said "off" when it was first asked, or it was turned off.
bool IsAllocTrackingOn();
void SetAllocTracking(bool on);

}  // namespace tessel

#endif
