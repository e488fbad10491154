// The library exception: what the class-style interfaces raise. The flat functions let none out.
#ifndef TESSEL_BASE_OVEXCEPT_H
#define TESSEL_BASE_OVEXCEPT_H

#include <tessel/base/MgErr.h>

#ifdef __cplusplus
#    include <exception>

namespace tessel {

// The return addresses of the calls that led somewhere, innermost first.
struct CallStack {
    static constexpr int32 kCapacity = 16;
    int32 count = 0;
    const void* addresses[kCapacity] = {};
};

// A result code and where it was raised.
class TESSEL_API OVExcept : public std::exception {
public:
    // The detail is cut at 127 bytes, of the file name the last 31 are kept; null leaves them empty. Records the call
    // stack. Allocates nothing.
    OVExcept(MgErr code, const char* detail, const char* file, int32 line) noexcept;

    // The result code.
    MgErr Code() const noexcept { return code_; }
    // The detail, terminated; empty for none.
    const char* Detail() const noexcept { return detail_; }
    // The source file, terminated; empty for none.
    const char* File() const noexcept { return file_; }
    // The line in the source file.
    int32 Line() const noexcept { return line_; }
    // The calls that led to where it was made.
    const CallStack& Stack() const noexcept { return stack_; }

    // "OVExcept. Err=<code>, File=<file>, Line=<line>, Detail='<detail>'", cut at 255 bytes. Of a file name of more
    // than 80 bytes it shows the last folders.
    const char* what() const noexcept override { return what_; }

private:
    MgErr code_;
    char detail_[128];
    char file_[32];
    int32 line_;
    char what_[256];
    CallStack stack_;
};

// What the handler that calls it has caught, as an OVExcept made at the given place: std::bad_alloc is 2, an OVExcept
// is returned as it is, any other std::exception is 42. Anything else is reported (level 3) and thrown on, unchanged.
// Call it inside a catch handler only.
TESSEL_API OVExcept GetExceptionInCatch_FileAndLine(const char* file, int32 line);

}  // namespace tessel

// Raises an OVExcept made here.
#    define TESSEL_THROW(code, detail) throw ::tessel::OVExcept((code), (detail), __FILE__, __LINE__)

#endif
#endif
