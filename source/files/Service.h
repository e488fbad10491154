// Start and stop of the file manager.
#ifndef TESSEL_SOURCE_FILES_SERVICE_H
#define TESSEL_SOURCE_FILES_SERVICE_H

#include <tessel/base/MgErr.h>

namespace tessel {

MgErr FileManagerStart();
MgErr FileManagerStop();

}  // namespace tessel

#endif
