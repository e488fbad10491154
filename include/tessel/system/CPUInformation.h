// The processors of this machine.
#ifndef TESSEL_SYSTEM_CPUINFORMATION_H
#define TESSEL_SYSTEM_CPUINFORMATION_H

#include <tessel/base/Types.h>

// Architectures that this library is built for.
enum { kCPUArchX86 = 3, kCPUArchX64 = 9 };

// The features that CPUInformation::GetFeatures knows are asked for with this selector.
#define kCPUFeatureSelector ((uint32)0x80000001)

TESSEL_BEGIN_C

// The name of an architecture (0 to 10), "<unknown value>" for any other. Constant text.
TESSEL_API CStr GetCPUArchName(int32 arch);

// Nothing: CPUInfo builds it.
TESSEL_API void InitCPUInformation(void);
// Destroys what CPUInfo built.
TESSEL_API void UninitCPUInformation(void);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/diagnostics/DebugStream.h>

#    include <string>

namespace tessel {

// What a processor can do.
class TESSEL_API CPUFeatures {
public:
    virtual ~CPUFeatures();
    // What it can do, a bit each (kCompareExchange8).
    virtual uint64 GetFlags() const = 0;
    // Hardware threads of a core.
    virtual uint8 GetThreadsPerCore() const = 0;

    static constexpr uint64 kCompareExchange8 = 512;  // 8 bytes at once
};

// The machine that the processors are in.
class TESSEL_API MachineDescription {
public:
    virtual ~MachineDescription();
    // Processors as the system counts them.
    virtual uint32 GetNumLogicalProcessors() const = 0;
    // Cores of all packages.
    virtual uint32 GetNumCores() const = 0;
    // Packages.
    virtual uint32 GetNumPackages() const = 0;
    // Null for a selector that is not known.
    virtual const CPUFeatures* GetFeatures(uint32 selector) const = 0;
};

// What is known of the processors of this machine.
class TESSEL_API CPUInformation {
public:
    // The architecture (kCPUArch...).
    virtual int32 GetArch() const = 0;
    // Its name.
    virtual const std::string& GetArchName() const = 0;
    // Processors as the system counts them.
    virtual uint32 GetNumLogicalCPUs() const = 0;
    // Threads of a core x cores.
    virtual uint32 GetNumHardwareThreads() const = 0;
    // Cores of all packages.
    virtual uint32 GetNumCores() const = 0;
    // Packages.
    virtual uint32 GetNumPackages() const = 0;
    // Null when the selector or the machine is not known.
    virtual const CPUFeatures* GetFeatures(uint32 selector) const = 0;
    // The machine; null when it is not known. It stays this object's.
    virtual const MachineDescription* GetMachineDescription() const = 0;
    // Appends "CPUArch: x64, NumLogicalCPUs: 8".
    virtual void WriteToDebugStream(DebugStream& stream) const = 0;
    virtual ~CPUInformation();
};

// Of this host. Built on the first call, the library's; null when memory runs out.
TESSEL_API CPUInformation* CPUInfo();

// WriteToDebugStream, or "Invalid CPUInformation" for null.
TESSEL_API void ToDebugStream(DebugStream& stream, const CPUInformation* info);

}  // namespace tessel

#endif
#endif
