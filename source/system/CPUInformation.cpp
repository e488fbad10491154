#include "diagnostics/Guarded.h"
#include "platform/System.h"
#include <tessel/system/CPUInformation.h>

#include <algorithm>
#include <atomic>
#include <iterator>
#include <memory>

CStr GetCPUArchName(int32 arch) {
    static const CStr kNames[] = {"InvalidCPU", "68K",   "PowerPC", "X86", "Sparc", "PARisc",
                                  "MIPS",       "Alpha", "ARM",     "x64", "PIC"};
    return arch >= 0 && arch < static_cast<int32>(std::size(kNames)) ? kNames[arch] : "<unknown value>";
}

namespace tessel {

CPUFeatures::~CPUFeatures() = default;
MachineDescription::~MachineDescription() = default;
CPUInformation::~CPUInformation() = default;

namespace {

class HostFeatures final : public CPUFeatures {
public:
    explicit HostFeatures(const platform::ProcessorFacts& facts)
        : flags_((facts.features & platform::kCompareExchange8) ? kCompareExchange8 : 0),
          threadsPerCore_(static_cast<uint8>(std::clamp<uint32>(facts.threadsPerCore, 1, 255))) {}
    uint64 GetFlags() const override { return flags_; }
    uint8 GetThreadsPerCore() const override { return threadsPerCore_; }

private:
    uint64 flags_;
    uint8 threadsPerCore_;
};

class HostMachine final : public MachineDescription {
public:
    HostMachine() : facts_(platform::GetProcessorFacts()), features_(facts_) {
        if (!facts_.trouble.empty()) TESSEL_REPORT(kDebugWarning, 0x5D20B7E4u) << facts_.trouble;
    }
    uint32 GetNumLogicalProcessors() const override { return facts_.logical; }
    uint32 GetNumCores() const override { return facts_.cores; }
    uint32 GetNumPackages() const override { return facts_.packages; }
    const CPUFeatures* GetFeatures(uint32 selector) const override {
        return selector == kCPUFeatureSelector ? &features_ : nullptr;
    }

private:
    platform::ProcessorFacts facts_;
    HostFeatures features_;
};

class HostCPUInformation;
std::atomic<HostCPUInformation*> singleton{nullptr};

class HostCPUInformation final : public CPUInformation {
public:
    HostCPUInformation()
        : archName_(GetCPUArchName(GetArch())),
          hardwareThreads_(machine_.GetFeatures(kCPUFeatureSelector)->GetThreadsPerCore() * machine_.GetNumCores()) {}
    ~HostCPUInformation() override {
        HostCPUInformation* self = this;
        singleton.compare_exchange_strong(self, nullptr);
    }
    int32 GetArch() const override { return sizeof(void*) == 8 ? kCPUArchX64 : kCPUArchX86; }
    const std::string& GetArchName() const override { return archName_; }
    uint32 GetNumLogicalCPUs() const override { return machine_.GetNumLogicalProcessors(); }
    uint32 GetNumHardwareThreads() const override { return hardwareThreads_; }
    uint32 GetNumCores() const override { return machine_.GetNumCores(); }
    uint32 GetNumPackages() const override { return machine_.GetNumPackages(); }
    const CPUFeatures* GetFeatures(uint32 selector) const override { return machine_.GetFeatures(selector); }
    const MachineDescription* GetMachineDescription() const override { return &machine_; }
    void WriteToDebugStream(DebugStream& stream) const override {
        stream.Append("CPUArch: ");
        stream.Append(archName_.c_str());
        stream.Append(", NumLogicalCPUs: ");
        tessel::ToDebugStream(stream, GetNumLogicalCPUs());
    }

private:
    HostMachine machine_;
    std::string archName_;
    uint32 hardwareThreads_;
};

}  // namespace

CPUInformation* CPUInfo() {
    if (HostCPUInformation* known = singleton.load(std::memory_order_acquire)) return known;
    return GuardedOr<CPUInformation*>(nullptr, []() -> CPUInformation* {
        auto made = std::make_unique<HostCPUInformation>();
        HostCPUInformation* first = nullptr;
        if (!singleton.compare_exchange_strong(first, made.get())) return first;
        return made.release();
    });
}

void ToDebugStream(DebugStream& stream, const CPUInformation* info) {
    if (info)
        info->WriteToDebugStream(stream);
    else
        stream.Append("Invalid CPUInformation");
}

}  // namespace tessel

void InitCPUInformation(void) {
}

void UninitCPUInformation(void) {
    delete tessel::singleton.load(std::memory_order_acquire);
}
