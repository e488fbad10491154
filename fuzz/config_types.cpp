// Any text for any type of setting: it is refused, or what is written of it reads back as what is written. Lists of
// texts that are escaped come back as they were.
//
// Input: a byte for the type, a byte for what the value was before, then the text.
#include "../tools/ConfigValue.h"
#include "config/Service.h"

#include <algorithm>
#include <cstdlib>
#include <iterator>

using tool::ConfigValue;

namespace {

constexpr int32 kTypes[] = {kConfigPStr, kConfigP255, kConfigLStr, kConfigNStr, kConfigNStV, kConfigENSV,
                            kConfigCPSt, kConfigECPS, kConfigBool, kConfigI32,  kConfigF32,  kConfigI32L,
                            kConfigPath, kConfigPthp, kConfigPLst, kConfigPRfL};

void Quiet(CStr, int32, CStr, int32, uint32, CStr) {
}

void Require(bool condition) {
    if (!condition) std::abort();
}

MgErr Read(int32 type, const std::string& text, ConfigValue& value) {
    return ConfigTypeFromString(type, text.data(), static_cast<int32>(text.size()), value.Pointer());
}

// What is written, without the quotes that the file takes off.
std::string Written(int32 type, ConfigValue& value) {
    LStrHandle handle = nullptr;
    Require(ConfigTypeToString(type, value.Pointer(), &handle) == kNoErr);
    std::string text(reinterpret_cast<char*>((*handle)->bytes), static_cast<size_t>((*handle)->count));
    DSDisposeHandle(reinterpret_cast<UHandle>(handle));
    if (text.size() > 1 && text.front() == '"' && text.back() == '"') text = text.substr(1, text.size() - 2);
    return text;
}

// A path may be written as nothing, as a path of no names, or with a name that reads as more than one.
bool IsPath(int32 type) {
    return type == kConfigPath || type == kConfigPthp || type == kConfigPLst || type == kConfigPRfL;
}

void CheckType(int32 type, const std::string& before, const std::string& text) {
    ConfigValue value(type), again(type);
    const bool hasBefore = Read(type, before, value) == kNoErr;
    const std::string writtenBefore = hasBefore ? Written(type, value) : "";
    const MgErr err = Read(type, text, value);
    Require(err == kNoErr || err == kConfigTextErr);
    if (err) {
        Require(!hasBefore || Written(type, value) == writtenBefore);
        return;
    }
    const std::string written = Written(type, value);
    const MgErr errAgain = Read(type, written, again);
    if (IsPath(type) && errAgain) return;
    Require(errAgain == kNoErr);
    Require(IsPath(type) || Written(type, again) == written);
    if (type == kConfigENSV)
        Require(written.empty() || *static_cast<std::vector<std::string>*>(value.Pointer()) ==
                                       *static_cast<std::vector<std::string>*>(again.Pointer()));
}

}  // namespace

extern "C" int LLVMFuzzerInitialize(int*, char***) {
    DebugOutputSetHandler(Quiet);
    return InitTesselBase() || InitConfigTypeRegistry() || tessel::ConfigCoreTypesStart();
}

extern "C" int LLVMFuzzerTestOneInput(const uint8* data, size_t size) {
    if (size < 2) return -1;
    const std::string text(reinterpret_cast<const char*>(data + 2), size - 2);
    CheckType(kTypes[data[0] % std::size(kTypes)], text.substr(0, data[1]), text);
    return 0;
}
