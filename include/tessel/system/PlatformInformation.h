// Operating system and processors together.
#ifndef TESSEL_SYSTEM_PLATFORMINFORMATION_H
#define TESSEL_SYSTEM_PLATFORMINFORMATION_H

#include <tessel/system/CPUInformation.h>
#include <tessel/system/OpSystemInfo.h>

#ifdef __cplusplus

namespace tessel {

// The operating system and the processors.
class TESSEL_API PlatformInformation {
public:
    // The operating system, as OSInfo().
    virtual OpSystemInfo* GetOSInfo() const = 0;
    // The processors, as CPUInfo().
    virtual CPUInformation* GetCPUInfo() const = 0;

protected:
    virtual ~PlatformInformation();
};

// OSInfo() and CPUInfo(). Built on the first call, the library's.
TESSEL_API PlatformInformation* PlatformInfo();

}  // namespace tessel

#endif
#endif
