// What the frame starts and stops of this folder.
#pragma once

#include <tessel/base/MgErr.h>

namespace tessel {

// The constants are there from the moment the library is loaded, so that code that runs before the service starts reads
// the same values; starting it cannot fail and leaves nothing to undo.
MgErr FloatingPointConstantsStart();
MgErr FloatingPointConstantsStop();

}  // namespace tessel
