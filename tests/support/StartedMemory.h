// Events, mutexes and the memory manager, started while the object lives. Reports are recorded, those of the stop too.
#ifndef TESSEL_TESTS_SUPPORT_STARTEDMEMORY_H
#define TESSEL_TESTS_SUPPORT_STARTEDMEMORY_H

#include "support/ReportRecorder.h"

namespace tessel::test {

class StartedMemory {
public:
    StartedMemory();
    ~StartedMemory();
    StartedMemory(const StartedMemory&) = delete;
    StartedMemory& operator=(const StartedMemory&) = delete;

    // Stops before the end, to look at the reports of the stop.
    void Stop();

    ReportRecorder reports;

private:
    bool started_ = true;
};

}  // namespace tessel::test

#endif
