// What refnums and data handles stand for, and what the objects behind them tell when they go, so that the flat
// interface never reaches one that has gone.
#ifndef TESSEL_SOURCE_RESOURCES_REFNUMS_H
#define TESSEL_SOURCE_RESOURCES_REFNUMS_H

#include "diagnostics/Guarded.h"
#include "resources/ResFileLock.h"
#include <tessel/resources/RFReadWrite.h>

namespace tessel {

// A resource gave its handle away, or ends: forgets the handles that were handed out last.
void EmptyHandleCache();

// The resource of a handle that was handed out, or the null one. The lock is held.
Resource* ResourceOf(UHandle handle);

// Hands out the data of a resource. The lock is held.
MgErr ShareHandle(Resource* resource, UHandle* data);

// Takes a refnum back; what it stands for stays. kNotResFileErr: there is none. The lock is held.
MgErr ForgetRefnum(RsrcFile refnum);

// What a refnum for a chain stands for; null for that of a file, and for none. The lock is held.
ResChain* MadeChain(RsrcFile refnum);

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
