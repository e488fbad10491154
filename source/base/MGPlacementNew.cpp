#include <tessel/base/MGPlacementNew.h>

#include <atomic>

namespace tessel {
namespace {

std::atomic<MGPlacementDeletor*> theNewest{nullptr};

}  // namespace

MGPlacementDeletor::~MGPlacementDeletor() = default;

void MGPlacementNewRegisterDeletor(MGPlacementDeletor* deletor) {
    if (!deletor) return;
    deletor->next_ = theNewest.load();
    while (!theNewest.compare_exchange_weak(deletor->next_, deletor)) {
    }
}

void MGPlacementNewRunCleanup() {
    for (MGPlacementDeletor* deletor = theNewest.exchange(nullptr); deletor;) {
        MGPlacementDeletor* const next = deletor->next_;
        delete deletor;
        deletor = next;
    }
}

}  // namespace tessel
