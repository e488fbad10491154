#include <tessel/events/MGEventTarget.h>
#include <tessel/events/MGUnknown.h>

namespace tessel {

const OVGuidType& MGUnknown::ClassID() {
    static constexpr OVGuidType kID = {0x04C7FA68, 0x5A10, 0x49D3, {0x96, 0x2C, 0xFE, 0x1B, 0x55, 0x47, 0xF5, 0x29}};
    return kID;
}

const OVGuidType& MGEvent::ClassID() {
    static constexpr OVGuidType kID = {0x44800CA1, 0x9918, 0x46E4, {0xB5, 0x6A, 0x3A, 0x64, 0x77, 0xBD, 0x47, 0x13}};
    return kID;
}

const OVGuidType& MGEventTargetBase::ClassID() {
    static constexpr OVGuidType kID = {0x01CC1DC9, 0x3C53, 0x4C57, {0x93, 0x39, 0xDC, 0x06, 0xAD, 0x47, 0x0D, 0x92}};
    return kID;
}

const OVGuidType& MGEventTarget::ClassID() {
    static constexpr OVGuidType kID = {0x4E4E9D55, 0x2F55, 0x42DB, {0xAE, 0x86, 0x3D, 0x9A, 0xF3, 0x0B, 0xF5, 0x13}};
    return kID;
}

void ToDebugStream(DebugStream& stream, MGUnknown* object) {
    if (object)
        object->WriteToDebugStream(stream);
    else
        stream.Append("<invalid MGUnknown object>");
}

}  // namespace tessel
