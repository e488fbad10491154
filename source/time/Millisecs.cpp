#include "platform/Clock.h"
#include <tessel/time/Millisecs.h>

uint32 MilliSecs(void) {
    return tessel::platform::TickMilliseconds();
}

int32 MillisecCmp(uint32 a, uint32 b) {
    return static_cast<int32>(a - b);
}

// The tick of this host is as fine as its multimedia timer: there is nothing to switch.
void MillisecSetUseMultimediaTimer(int32) {
}
