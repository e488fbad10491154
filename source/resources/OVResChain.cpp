#include "resources/OVResChain.h"

#include <algorithm>

namespace tessel {

OVResChain* OVResChain::gFirst = nullptr;

OVResChain::OVResChain(Files files, bool owns) : fFiles(std::move(files)), fOwns(owns) {
    ResFileLock lock;
    fNext = gFirst;
    gFirst = this;
}

OVResChain::~OVResChain() {
    ResFileLock lock;
    OVResChain** link = &gFirst;
    while (*link != this) link = &(*link)->fNext;
    *link = fNext;
}

void OVResChain::Forget(const ResChain* file) {
    for (OVResChain* chain = gFirst; chain; chain = chain->fNext)
        chain->fFiles.erase(std::remove(chain->fFiles.begin(), chain->fFiles.end(), file), chain->fFiles.end());
}

}  // namespace tessel
