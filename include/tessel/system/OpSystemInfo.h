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
    // No flag.
    static const OpSystemFeatureFlags& kNone();
    // The flag 1.
    static const OpSystemFeatureFlags& kFirstBit();
    // The system has 64 bits: 1.
    static const OpSystemFeatureFlags& k64Bit();
    // HRWallClockTime counts processor time: 0x10000.
    static const OpSystemFeatureFlags& kIsNTOS();

    // The flags that are in both.
    OpSystemFeatureFlags operator&(const OpSystemFeatureFlags& other) const;
    // Whether there is any flag.
    bool IsNonZero() const { return flags_ != 0; }

private:
    friend class HostSystemInfo;
    explicit OpSystemFeatureFlags(uint64 flags) : flags_(flags) {}
    uint64 flags_;
};

// What is known of the operating system.
class TESSEL_API OpSystemInfo {
public:
    virtual ~OpSystemInfo();
    // The target that the library is built for (kOSTarget...).
    virtual int32 GetTargetID() const = 0;
    // The family of systems that it belongs to.
    virtual const std::string& GetFamilyName() const = 0;
    // The name of the system.
    virtual const std::string& GetName() const = 0;
    // The version, "major.minor".
    virtual const std::string& GetVersionText() const = 0;
    // The build as the system names it.
    virtual const std::string& GetBuildText() const = 0;
    // The major version.
    virtual uint32 GetMajorVersion() const = 0;
    // The minor version.
    virtual uint32 GetMinorVersion() const = 0;
    // The number of the build.
    virtual uint32 GetBuildNumber() const = 0;
    // The major number of the service pack.
    virtual uint16 GetServicePackMajor() const = 0;
    // The minor number of the service pack.
    virtual uint16 GetServicePackMinor() const = 0;
    // What the system can do.
    virtual const OpSystemFeatureFlags& GetFeatureFlags() const = 0;
};

// Of this host. Built on the first call, the library's.
TESSEL_API OpSystemInfo* OSInfo();

// Appends the full name; nothing for null.
TESSEL_API void ToDebugStream(DebugStream& stream, const OpSystemInfo* info);

}  // namespace tessel

#endif
#endif
