// Class identifiers: 16 bytes that are unique, and their text, the 36 characters 8-4-4-4-12 of RFC 4122 in lower case.
// Any thread.
#ifndef TESSEL_UTILITIES_OVGUID_H
#define TESSEL_UTILITIES_OVGUID_H

#include <tessel/base/MgErr.h>
#include <tessel/base/Types.h>

typedef struct OVGuidType {
    uint32 data1;  // the first eight digits of the text, as a number of the host
    uint16 data2;
    uint16 data3;
    uint8 data4[8];  // in the order of the text
} OVGuidType;

#define kOVGuidTextSize 37  // the text and its terminator

TESSEL_BEGIN_C

// A new random identifier (version 4). Nothing for null. When the host has no randomness to give, two numbers of
// RandomGen stand in.
TESSEL_API void OVGuidCreate(OVGuidType* out);

// From the text, in either case. kArgErr for a null text, kNoErr and nothing done for a null output; kGuidErr, and the
// output as it was, for any text that is not exactly the form.
TESSEL_API MgErr OVGuidFromCStr(CStr text, OVGuidType* out);

// Writes the text and its terminator: kOVGuidTextSize bytes. kNoErr and nothing done for a null output; kGuidErr and
// empty text for a null identifier.
TESSEL_API MgErr OVGuidToCStr(const OVGuidType* guid, char* out);

// The text of a new identifier, as OVGuidToCStr writes it.
TESSEL_API MgErr OVGuidCreateStr(char* out);

// 16 zero bytes.
TESSEL_API const OVGuidType* NullOVGuid(void);

// Two nulls are equal, one is equal to nothing.
TESSEL_API bool OVGuidsEqual(const OVGuidType* a, const OVGuidType* b);

TESSEL_END_C

#ifdef __cplusplus
#    include <tessel/diagnostics/DebugStream.h>

namespace tessel {

// Appends the text.
TESSEL_API void ToDebugStream(DebugStream& stream, const OVGuidType& guid);

}  // namespace tessel

#endif
#endif
