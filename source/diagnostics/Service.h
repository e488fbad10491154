// Start and stop of the reports' buffers.
#ifndef TESSEL_SOURCE_DIAGNOSTICS_SERVICE_H
#define TESSEL_SOURCE_DIAGNOSTICS_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

// Reports take their buffers from a pool between the two; before and after it each allocates its own.
MgErr DebugStreamStart();
MgErr DebugStreamStop();

}  // namespace tessel

#endif
