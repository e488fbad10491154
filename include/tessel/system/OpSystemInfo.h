// The operating system: what it is, its version and what it can do.
#ifndef TESSEL_SYSTEM_OPSYSTEMINFO_H
#define TESSEL_SYSTEM_OPSYSTEMINFO_H

#include <tessel/base/Types.h>

// Targets that this library is built for.
enum { kOSTargetLinux = 8, kOSTargetLinuxX64 = 19 };

TESSEL_BEGIN_C

// The name of a target identifier (0 to 19), "<unknown value>" for any other. Constant text.
TESSEL_API CStr GetOSNameFromID(int32 targetID);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/diagnostics/DebugStream.h>

#    include <string>

namespace tessel {

// A set of flags.
class TESSEL_API OpSystemFeatureFlags {
public:
    static const OpSystemFeatureFlags& kNone();
    static const OpSystemFeatureFlags& kFirstBit();
    static const OpSystemFeatureFlags& k64Bit();   // 1
    static const OpSystemFeatureFlags& kIsNTOS();  // 0x10000: HRWallClockTime counts processor time

    OpSystemFeatureFlags operator&(const OpSystemFeatureFlags& other) const;
    bool IsNonZero() const { return fFlags != 0; }

private:
    friend class HostSystemInfo;
    explicit OpSystemFeatureFlags(uint64 flags) : fFlags(flags) {}
    uint64 fFlags;
};

class TESSEL_API OpSystemInfo {
public:
    virtual ~OpSystemInfo();
    virtual int32 GetTargetID() const = 0;
    virtual const std::string& GetFamilyName() const = 0;
    virtual const std::string& GetName() const = 0;
    virtual const std::string& GetVersionText() const = 0;  // "major.minor"
    virtual const std::string& GetBuildText() const = 0;
    virtual uint32 GetMajorVersion() const = 0;
    virtual uint32 GetMinorVersion() const = 0;
    virtual uint32 GetBuildNumber() const = 0;
    virtual uint16 GetServicePackMajor() const = 0;
    virtual uint16 GetServicePackMinor() const = 0;
    virtual const OpSystemFeatureFlags& GetFeatureFlags() const = 0;
};

// Of this host. Built on the first call, the library's.
TESSEL_API OpSystemInfo* OSInfo();

// Appends the full name; nothing for null.
TESSEL_API void ToDebugStream(DebugStream& stream, const OpSystemInfo* info);

}  // namespace tessel

#endif
#endif
