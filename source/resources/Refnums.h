// What the objects behind refnums and handles tell the flat interface, so that it never reaches one that has gone.
#ifndef TESSEL_SOURCE_RESOURCES_REFNUMS_H
#define TESSEL_SOURCE_RESOURCES_REFNUMS_H

#include "diagnostics/Guarded.h"
#include "resources/ResFileLock.h"
#include <tessel/resources/RFReadWrite.h>

namespace tessel {

// A resource gave its handle away, or ends: forgets the handles that were handed out last.
void EmptyHandleCache();

// A file or chain is about to be destroyed: forgets its refnums, and takes it out of the chains.
void ForgetRefnumsOf(const ResChain* chain);

// Runs `read` on a reader of what the refnum stands for. The lock is held from the look at the refnum on, so that no
// other thread closes the file in between.
template <class Read>
MgErr ReadLocked(RsrcFile refnum, Read read) {
    return Guarded([&] {
        ResFileLock lock;
        RFReader reader(refnum);
        return read(reader);
    });
}

}  // namespace tessel

#endif
