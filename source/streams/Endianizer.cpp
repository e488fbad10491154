// The conversions between the byte order of a stream and the host's.
#include <tessel/streams/Endianizer.h>

#include <cstring>

namespace tessel {
namespace {

constexpr uint32 kStandardFXSize = 16;  // the standard form has the layout of IEEE 754 binary128
constexpr uint32 kNativeFXSize = 10;
constexpr uint16 kExponentMask = 0x7FFF;
constexpr uint64 kIntegerBit = uint64{1} << 63;

static_assert(sizeof(floatExt) == kNativeFXSize);

uint16 Swapped(uint16 value) {
    return __builtin_bswap16(value);
}
uint32 Swapped(uint32 value) {
    return __builtin_bswap32(value);
}
uint64 Swapped(uint64 value) {
    return __builtin_bswap64(value);
}

template <class T>
T Load(const void* address) {
    T value;
    std::memcpy(&value, address, sizeof value);
    return value;
}

template <class T>
void Store(T value, void* address) {
    std::memcpy(address, &value, sizeof value);
}

// What stands in the fraction field of the standard form: the mantissa without its integer bit, at the top.
uint64 FractionOf(const floatExt& value) {
    return (value.signExponent & kExponentMask) ? value.mantissa << 1 : value.mantissa;
}

floatExt FromParts(uint16 signExponent, uint64 fraction) {
    floatExt value;
    value.signExponent = signExponent;
    value.mantissa = (signExponent & kExponentMask) ? (fraction >> 1) | kIntegerBit : fraction;
    return value;
}

// A stream in the host's order.
class _NonSwappingEndianizer : public Endianizer {
public:
    int16 ToNative16(const void* stream) const override { return Load<int16>(stream); }
    int32 ToNative32(const void* stream) const override { return Load<int32>(stream); }
    void CopyToNative16(const void* stream, void* host) const override { std::memcpy(host, stream, 2); }
    void CopyToNative32(const void* stream, void* host) const override { std::memcpy(host, stream, 4); }
    void CopyToNative64(const void* stream, void* host) const override { std::memcpy(host, stream, 8); }
    void CopyToNative128(const void* stream, void* host) const override { std::memcpy(host, stream, 16); }
    void FromNative16(int16 value, void* stream) const override { Store(value, stream); }
    void FromNative32(int32 value, void* stream) const override { Store(value, stream); }
    void FromNative64(int64 value, void* stream) const override { Store(value, stream); }
    void FromNative128(const void* value, void* stream) const override { std::memcpy(stream, value, 16); }
    int32 IsSwapping() const override { return 0; }

    uint32 StreamFXSize() const override { return kStandardFXSize; }

    floatExt ToNativeFX(const void* stream) const override {
        const uint8* bytes = static_cast<const uint8*>(stream);
        return FromParts(Load<uint16>(bytes + 14), Load<uint64>(bytes + 6));
    }

    void FromNativeFX(const floatExt& value, void* stream) const override {
        uint8* bytes = static_cast<uint8*>(stream);
        std::memset(bytes, 0, 6);
        Store(FractionOf(value), bytes + 6);
        Store(uint16{value.signExponent}, bytes + 14);
    }
};

// A stream that never leaves the host: in its order, and extended reals as they lie in memory.
class _NativeEndianizer final : public _NonSwappingEndianizer {
public:
    uint32 StreamFXSize() const override { return kNativeFXSize; }
    floatExt ToNativeFX(const void* stream) const override { return Load<floatExt>(stream); }
    void FromNativeFX(const floatExt& value, void* stream) const override { Store(value, stream); }
};

// A stream in the other order.
class _SwappingEndianizer final : public Endianizer {
public:
    int16 ToNative16(const void* stream) const override { return static_cast<int16>(Swapped(Load<uint16>(stream))); }
    int32 ToNative32(const void* stream) const override { return static_cast<int32>(Swapped(Load<uint32>(stream))); }
    void CopyToNative16(const void* stream, void* host) const override { Store(Swapped(Load<uint16>(stream)), host); }
    void CopyToNative32(const void* stream, void* host) const override { Store(Swapped(Load<uint32>(stream)), host); }
    void CopyToNative64(const void* stream, void* host) const override { Store(Swapped(Load<uint64>(stream)), host); }

    void CopyToNative128(const void* stream, void* host) const override {
        const uint64 first = Load<uint64>(stream);
        const uint64 second = Load<uint64>(static_cast<const uint8*>(stream) + 8);
        Store(Swapped(second), host);
        Store(Swapped(first), static_cast<uint8*>(host) + 8);
    }

    void FromNative16(int16 value, void* stream) const override { Store(Swapped(static_cast<uint16>(value)), stream); }
    void FromNative32(int32 value, void* stream) const override { Store(Swapped(static_cast<uint32>(value)), stream); }
    void FromNative64(int64 value, void* stream) const override { Store(Swapped(static_cast<uint64>(value)), stream); }
    void FromNative128(const void* value, void* stream) const override { CopyToNative128(value, stream); }
    int32 IsSwapping() const override { return 1; }

    uint32 StreamFXSize() const override { return kStandardFXSize; }

    floatExt ToNativeFX(const void* stream) const override {
        const uint8* bytes = static_cast<const uint8*>(stream);
        return FromParts(Swapped(Load<uint16>(bytes)), Swapped(Load<uint64>(bytes + 2)));
    }

    void FromNativeFX(const floatExt& value, void* stream) const override {
        uint8* bytes = static_cast<uint8*>(stream);
        Store(Swapped(uint16{value.signExponent}), bytes);
        Store(Swapped(FractionOf(value)), bytes + 2);
        std::memset(bytes + 10, 0, 6);
    }
};

// The host is little-endian (base/Types.h sees to it). The objects exist before any code runs.
constinit _NativeEndianizer nativeEndianizer;
constinit _SwappingEndianizer bigEndianizer;
constinit _NonSwappingEndianizer littleEndianizer;

}  // namespace

Endianizer::~Endianizer() = default;

const Endianizer* NativeEndianizer() {
    return &nativeEndianizer;
}
const Endianizer* BigEndianizer() {
    return &bigEndianizer;
}
const Endianizer* LittleEndianizer() {
    return &littleEndianizer;
}

}  // namespace tessel

using namespace tessel;

void SwapBW(void* value16) {
    if (value16) Store(Swapped(Load<uint16>(value16)), value16);
}

void SwapWL(void* value32) {
    if (!value32) return;
    const uint32 value = Load<uint32>(value32);
    Store((value << 16) | (value >> 16), value32);
}

void RevBL(void* value32) {
    if (value32) Store(Swapped(Load<uint32>(value32)), value32);
}

void RevBQ(void* value64) {
    if (value64) Store(Swapped(Load<uint64>(value64)), value64);
}
