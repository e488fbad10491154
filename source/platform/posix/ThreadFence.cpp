#include "platform/ThreadFence.h"

#include "platform/posix/SystemCalls.h"

#include <linux/membarrier.h>

namespace tessel::platform {

bool FenceEveryThreadAvailable() noexcept {
    return systemCalls.membarrier(MEMBARRIER_CMD_REGISTER_PRIVATE_EXPEDITED, 0) == 0;
}

void FenceEveryThread() noexcept {
    systemCalls.membarrier(MEMBARRIER_CMD_PRIVATE_EXPEDITED, 0);
}

}  // namespace tessel::platform
