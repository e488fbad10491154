// What unknown refnums and unknown handles resolve to.
#ifndef TESSEL_SOURCE_RESOURCES_NULLOBJECTS_H
#define TESSEL_SOURCE_RESOURCES_NULLOBJECTS_H

#include <tessel/resources/ovresfile.h>

namespace tessel {

// The one object of each kind. Not to be deleted.
ResFile* NULLResFile();
Resource* NULLResource();

}  // namespace tessel

#endif
