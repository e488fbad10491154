// Numbers in settings, the same in every locale.
#ifndef TESSEL_SOURCE_CONFIG_CONFIGNUMBERS_H
#define TESSEL_SOURCE_CONFIG_CONFIGNUMBERS_H

#include <tessel/base/Types.h>

#include <string>
#include <string_view>

namespace tessel {

// The decimal number that the text begins with, white space and a sign before it; saturated. The text is then what
// follows it. False, and nothing changed, when there is none.
bool ParseInt32(std::string_view* text, int32* value);

// The number that the text begins with, as strtof reads it in the "C" locale: "inf", "nan" and hexadecimal ones too.
bool ParseFloat32(std::string_view text, float* value);

// "%f" in the "C" locale.
std::string Float32Text(float value);

}  // namespace tessel

#endif
