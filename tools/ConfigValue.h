// A value of any of the library's configuration types, chosen when it is made.
#ifndef TESSEL_TOOLS_CONFIGVALUE_H
#define TESSEL_TOOLS_CONFIGVALUE_H

#include <tessel/tessel.h>

#include <list>
#include <string>
#include <vector>

namespace tool {

class ConfigValue {
public:
    explicit ConfigValue(int32 type) : type_(type), handle_(DSNewHClr(0)) {}
    ~ConfigValue() {
        FDestroyPath(&path_);
        const auto list = reinterpret_cast<ConfigPathListHandle>(handle_);
        const bool hasPaths = type_ == kConfigPLst && DSGetHandleSize(handle_) != 0;
        for (int32 i = 0; hasPaths && i < (*list)->count; ++i) FDestroyPath(&(*list)->paths[i]);
        DSDisposeHandle(handle_);
    }
    ConfigValue(const ConfigValue&) = delete;
    ConfigValue& operator=(const ConfigValue&) = delete;

    // What the calls of the library take; null for a type that is none of its own.
    void* Pointer() {
        switch (type_) {
            case kConfigPStr:
            case kConfigLStr:
            case kConfigCPSt:
            case kConfigECPS:
            case kConfigI32L:
            case kConfigPLst:
                return handle_;
            case kConfigP255:
                return string_;
            case kConfigNStr:
                return &text_;
            case kConfigNStV:
            case kConfigENSV:
                return &texts_;
            case kConfigBool:
            case kConfigI32:
                return &number_;
            case kConfigF32:
                return &real_;
            case kConfigPath:
                return &pathRef_;
            case kConfigPthp:
                return &path_;
            case kConfigPRfL:
                return &paths_;
            default:
                return nullptr;
        }
    }

private:
    const int32 type_;
    const UHandle handle_;
    Path path_ = nullptr;
    tessel::PathRef pathRef_;
    std::list<tessel::PathRef> paths_;
    Str255 string_ = {};
    std::string text_;
    std::vector<std::string> texts_;
    int32 number_ = 0;
    float real_ = 0;
};

}  // namespace tool

#endif
