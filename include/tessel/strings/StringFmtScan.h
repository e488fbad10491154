// The scanners that the format language is made of.
//
// Both read at *cursor, never at or beyond end, and move *cursor past what they took. With null pointers they take
// nothing. Any thread.
#ifndef TESSEL_STRINGS_STRINGFMTSCAN_H
#define TESSEL_STRINGS_STRINGFMTSCAN_H

#include <tessel/base/Types.h>

TESSEL_BEGIN_C

// Reads one character that may be escaped, and returns it; 0 at the end.
//   \ and one or two of 0-9 A-F   that byte          \n 10   \r 13   \t 9   \f 12   \b 8   \s space
//   \ and anything else           that byte          \ at the end is itself
// Lower-case letters are not hexadecimal digits here.
TESSEL_API uint8 ScanForBackslash(CStr* cursor, CStr end);

// Recognises a decimal-point specifier, *cursor being just after its "%": a punctuation character, which may be
// escaped, and ";" make that character the decimal point; ";" alone stands for the process-wide one. True if there was
// one, with the decimal point in *decimalPoint; otherwise *cursor and *decimalPoint are unchanged. "%[" and "%%" never
// are.
TESSEL_API bool ScanForFormatDecPoint(CStr* cursor, CStr end, uint8* decimalPoint);

TESSEL_END_C

#endif
