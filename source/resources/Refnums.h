// What the objects behind refnums and handles tell the flat interface, so that it never reaches one that has gone.
#ifndef TESSEL_SOURCE_RESOURCES_REFNUMS_H
#define TESSEL_SOURCE_RESOURCES_REFNUMS_H

#include <tessel/resources/ovresfile.h>

namespace tessel {

// A resource gave its handle away, or ends: forgets the handles that were handed out last.
void EmptyHandleCache();

// A file or chain is about to be destroyed: forgets its refnums.
void ForgetRefnumsOf(const ResChain* chain);

}  // namespace tessel

#endif
