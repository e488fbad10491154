// Formatted printing.
//
// A format is text with conversion specifiers:
//
//   %[-][0][width][.precision][{type} | I | ll | l]conversion        the arguments in order
//   %n$[-][0][width]...conversion                                    argument n, 1 to 10; all specifiers or none
//
//   d i    int32                signed decimal               s   CStr; null prints nothing
//   u      int32                unsigned decimal             p   PStr
//   x      int32                hexadecimal, 0-9 A-F         P   LStr pointer (also p with a size modifier)
//   o b    int32                octal, binary                H   LStr handle; null prints nothing
//   a      int32                0x and 8 digits              h   pointer to a FmtBytes record
//   e g    double               exponential form             z   Path; null prints NULL
//   f      double               fixed form; exponential      q   int32 holding a point, v low, h high: (h,v)
//                               if it would not fit          r   pointer to int16 top, left, bottom, right
//   c      int32                one byte; with width 2 or 4  Q R the same after "hv", "tlbr"
//                               that many bytes of it        %   a percent sign
//
// E, F, G are the same as e, f, g. There are no "+", " " and "#" flags, and "X", "n", "S" are not conversions. "I"
// means a 32-bit integer, "ll" a 64-bit one. A {type} takes a pointer to a value of that type: {iB} {iW} {iL} {iQ}
// integers of 8 to 64 bits, {uB} ... {uQ} unsigned ones, {fS} {fD} {fX} single, double, extended, {cS} {cD} {cX}
// complex, {*} a type code given as an int16 argument before the pointer. "-" pads on the right; precision limits the
// bytes taken of any text. Padding and the number of digits never make the output exceed its size.
//
// "%,;" (any punctuation character) makes the comma the decimal point from there on, "%;" returns to the process-wide
// one. A backslash in the format is an escape (strings/StringFmtScan.h), and "\n" so written gives CR LF.
//
// A specifier that is not of this language is reported (fatal) and ends the output there. Arguments must match the
// specifiers in number and type; of text arguments and rectangles, null prints nothing. A null format is the empty one.
// Where the text goes to a buffer, the arguments may not lie in it. All functions may be called from any thread.
#ifndef TESSEL_STRINGS_STRINGFMTPRINT_H
#define TESSEL_STRINGS_STRINGFMTPRINT_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>

#include <stdarg.h>

// The argument of "%h".
typedef struct FmtBytes {
    const void* bytes;
    int32 length;
} FmtBytes;

TESSEL_BEGIN_C

// The engine: formats into at most `size` bytes at dst, -1 meaning no limit, and adds no terminator. The format is a
// byte range, in which a zero byte is an ordinary one. Returns the bytes written; with a null dst, in which case size
// is not looked at, the bytes that would be.
TESSEL_API int32 SPrintfv(char* dst, int32 size, const char* format, int32 formatLength, va_list args);

// Without a limit; dst is terminated. Return the length, which is all that they do with a null dst.
TESSEL_API int32 SPrintf(char* dst, CStr format, ...);
// As SPrintf, with the format in a PStr.
TESSEL_API int32 SPrintfp(char* dst, ConstPStr format, ...);

// Writes at most size - 1 bytes and a terminator, nothing when size is 0. Returns the length the engine reached, at
// most `size`: a result equal to size means that the text was cut. With a null dst the full length.
TESSEL_API int32 SNPrintf(char* dst, int32 size, CStr format, ...);

// Into a PStr of at most 255 bytes; dst must take 256. Return the length; 0 with a null dst.
TESSEL_API int32 PPrintf(PStr dst, CStr format, ...);
// As PPrintf, with the format in a PStr.
TESSEL_API int32 PPrintfp(PStr dst, ConstPStr format, ...);

// Into a handle, which is sized to the text; the arguments may lie in it. kArgErr for a null handle or format, the
// handle manager's error when it cannot grow, kGenericErr (reported) when another thread changed an argument's text
// meanwhile. On failure the handle's text is as it was.
TESSEL_API MgErr LStrPrintf(LStrHandle dst, CStr format, ...);

TESSEL_END_C

#endif
