#include "resources/OVResChain.h"

#include <algorithm>

namespace tessel {

OVResChain* OVResChain::first_ = nullptr;

OVResChain::OVResChain(Files files, bool owns) : files_(std::move(files)), owns_(owns) {
    ResFileLock lock;
    next_ = first_;
    first_ = this;
}

OVResChain::~OVResChain() {
    ResFileLock lock;
    OVResChain** link = &first_;
    while (*link != this) link = &(*link)->next_;
    *link = next_;
}

void OVResChain::Forget(const ResChain* file) {
    for (OVResChain* chain = first_; chain; chain = chain->next_)
        chain->files_.erase(std::remove(chain->files_.begin(), chain->files_.end(), file), chain->files_.end());
}

}  // namespace tessel
