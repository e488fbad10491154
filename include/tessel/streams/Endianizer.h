// Byte order: helpers that turn a value around in place, and the Endianizers, which convert between the byte order of a
// stream and the host's.
#ifndef TESSEL_STREAMS_ENDIANIZER_H
#define TESSEL_STREAMS_ENDIANIZER_H

#include <tessel/base/NumericTypes.h>
#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// In place; the value may lie at any address. A null pointer is not allowed. Any thread.
TESSEL_API void SwapBW(void* value16);  // exchanges the two bytes of a 16-bit value
// Exchanges the two 16-bit halves of a 32-bit value.
TESSEL_API void SwapWL(void* value32);
// Reverses the four bytes of a 32-bit value.
TESSEL_API void RevBL(void* value32);
// Reverses the eight bytes of a 64-bit value.
TESSEL_API void RevBQ(void* value64);

TESSEL_END_C

#ifdef __cplusplus
namespace tessel {

// Converts between stream bytes and host values. Immutable: one instance serves all threads.
//
// Pointers may have any alignment. Single and double reals go through the 32- and 64-bit operations. An extended real
// takes up StreamFXSize bytes: 16 in the standard form of the big- and little-endian Endianizers (sign and exponent in
// the first two bytes, the fraction in the next eight, six zero bytes; the little-endian form is the reverse of it), 10
// in the native one, which keeps the value as it lies in memory.
class TESSEL_API Endianizer {
public:
    virtual ~Endianizer();

    // The value of two stream bytes.
    virtual int16 ToNative16(const void* stream) const = 0;
    // The value of four stream bytes.
    virtual int32 ToNative32(const void* stream) const = 0;
    // Converts two stream bytes into a host value.
    virtual void CopyToNative16(const void* stream, void* host) const = 0;
    // Converts four stream bytes into a host value.
    virtual void CopyToNative32(const void* stream, void* host) const = 0;
    // Converts eight stream bytes into a host value.
    virtual void CopyToNative64(const void* stream, void* host) const = 0;
    // The extended real at `stream`, StreamFXSize bytes of it.
    virtual floatExt ToNativeFX(const void* stream) const = 0;
    // Converts StreamFXSize stream bytes into an extended real.
    virtual void CopyToNative128(const void* stream, void* host) const = 0;

    // Stores a value as two stream bytes.
    virtual void FromNative16(int16 value, void* stream) const = 0;
    // Stores a value as four stream bytes.
    virtual void FromNative32(int32 value, void* stream) const = 0;
    // Stores a value as eight stream bytes.
    virtual void FromNative64(int64 value, void* stream) const = 0;
    // Stores an extended real as StreamFXSize bytes.
    virtual void FromNativeFX(const floatExt& value, void* stream) const = 0;
    // Stores the extended real at `value` as StreamFXSize bytes.
    virtual void FromNative128(const void* value, void* stream) const = 0;

    // Bytes of an extended real in the stream: 16 or 10.
    virtual uint32 StreamFXSize() const = 0;
    // 1 when the stream's order is not the host's, else 0.
    virtual int32 IsSwapping() const = 0;

protected:
    Endianizer() = default;
    Endianizer(const Endianizer&) = default;
    Endianizer& operator=(const Endianizer&) = default;
};

// The three Endianizers. They belong to the library and live as long as it is loaded. Any thread.
// The bytes as they lie in memory.
TESSEL_API const Endianizer* NativeEndianizer();
// Most significant byte first.
TESSEL_API const Endianizer* BigEndianizer();
// Least significant byte first.
TESSEL_API const Endianizer* LittleEndianizer();

}  // namespace tessel
#endif

#endif
