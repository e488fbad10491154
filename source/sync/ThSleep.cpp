#include "platform/Clock.h"
#include "platform/Thread.h"
#include <tessel/sync/ThSleep.h>
#include <tessel/time/Millisecs.h>

void ThSleep(uint32 milliseconds) {
    tessel::platform::SleepMilliseconds(milliseconds);
}

void ThPause(uint32 count) {
    do tessel::platform::SpinPause();
    while (--count != 0);
}

uint32 ThWaitTill(uint32 deadline, uint32 now) {
    const int32 left = MillisecCmp(deadline, now);
    if (left < 1) return now;
    ThSleep(static_cast<uint32>(left >= 2 ? left - 1 : left));
    return MilliSecs();
}
