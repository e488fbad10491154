// Reports: one line of text with a level, the place it was made at and a constant of that place.
//
//     TESSEL_REPORT(kDebugWarning, 0x1B2C3D4Eu) << "Cannot lock " << count << " handles.";
//
// DebugStream         the text of one report
// TESSEL_REPORT       makes a report where it stands
// ToDebugStream       appends a value; other headers add overloads for their own types
// DbgFmt...           values written in a form of their own: hexadecimal, pointers, four-character codes
#ifndef TESSEL_DIAGNOSTICS_DEBUGSTREAM_H
#define TESSEL_DIAGNOSTICS_DEBUGSTREAM_H

#include <tessel/base/NumericTypes.h>
#include <tessel/base/StringTypes.h>
#include <tessel/base/Types.h>
#include <tessel/diagnostics/DebugOutput.h>

#ifdef __cplusplus
#    include <cstdio>
#    include <cstring>
#    include <string_view>
#    include <type_traits>

namespace tessel {

// The text of one report while it is made. At most 255 bytes fit, what goes beyond is dropped; the text is always
// terminated. The file and identifier texts are kept by address. Belongs to one thread. Works at all times: before the
// library is started and after it is stopped too.
class TESSEL_API DebugStream {
public:
    // An empty text. File and identifier are those of the reporting site, kept by address.
    DebugStream(CStr file, int32 line, CStr identifier, _DebugOutputLevel level) noexcept;
    ~DebugStream() { GiveBack(); }
    DebugStream(const DebugStream&) = delete;
    DebugStream& operator=(const DebugStream&) = delete;

    // The constant of the reporting site; 0 until set.
    void SetSiteCode(uint32 siteCode) noexcept { siteCode_ = siteCode; }

    // Appends one byte.
    void Append(char byte) noexcept { Append(&byte, &byte + 1); }
    // Appends terminated text; nothing for null.
    void Append(CStr text) noexcept;
    // Appends a range of bytes; nothing for an empty one.
    void Append(const char* begin, const char* end) noexcept;

    // The text so far, terminated; empty after Process.
    CStr Text() const noexcept { return text_ ? text_ : ""; }
    // Bytes of the text so far.
    size_t Length() const noexcept { return static_cast<size_t>(write_ - text_); }

    // Hands the report to DebugOutputCallHandler, then gives the buffer back. Nothing can be appended after it.
    void Process();

private:
    void GiveBack() noexcept;

    CStr file_;
    int32 line_;
    CStr identifier_;
    int32 level_;
    uint32 siteCode_ = 0;
    char* text_;
    char* write_;
    char* last_;     // the last usable byte, kept for the terminator
    uint32* inUse_;  // the in-use word of the pool's slot; null for a private buffer
};

// The byte as it is.
TESSEL_API void ToDebugStream(DebugStream& stream, char byte);
// The text; null appends nothing.
TESSEL_API void ToDebugStream(DebugStream& stream, CStr text);
// The bytes of the text.
TESSEL_API void ToDebugStream(DebugStream& stream, std::string_view text);
// The bytes; null appends nothing.
TESSEL_API void ToDebugStream(DebugStream& stream, const LStr* text);
// The bytes; null appends nothing.
TESSEL_API void ToDebugStream(DebugStream& stream, LStrHandle text);
// The bytes; null appends nothing.
TESSEL_API void ToDebugStream(DebugStream& stream, const LStrHandle* text);
// Decimal, as all integers.
TESSEL_API void ToDebugStream(DebugStream& stream, short value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, int value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, long value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, long long value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, unsigned char value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, unsigned short value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, unsigned int value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, unsigned long value);
// Decimal.
TESSEL_API void ToDebugStream(DebugStream& stream, unsigned long long value);
// Six digits after the point.
TESSEL_API void ToDebugStream(DebugStream& stream, float value);
// Six digits after the point.
TESSEL_API void ToDebugStream(DebugStream& stream, double value);
// The two parts, "(re, im)".
TESSEL_API void ToDebugStream(DebugStream& stream, const cmplx64& value);
// The two parts, "(re, im)".
TESSEL_API void ToDebugStream(DebugStream& stream, const cmplx128& value);
// The address, upper-case hexadecimal.
TESSEL_API void ToDebugStream(DebugStream& stream, void (*function)());

// The address of a function of any type.
template <class R, class... A>
void ToDebugStream(DebugStream& stream, R (*function)(A...)) {
    ToDebugStream(stream, reinterpret_cast<void (*)()>(function));
}

// A value with a written form of its own. The helpers below hold their value; texts are kept by address.
class TESSEL_API DbgFmtToDebugStream {
public:
    // Appends the written form of the value.
    virtual void ToDebugStream(DebugStream& stream) const = 0;

protected:
    ~DbgFmtToDebugStream() = default;
};

// The value in its own written form.
inline void ToDebugStream(DebugStream& stream, const DbgFmtToDebugStream& value) {
    value.ToDebugStream(stream);
}

// A CStr as it is. Null writes nothing.
class TESSEL_API DbgFmtCStr final : public DbgFmtToDebugStream {
public:
    // Keeps the address of the text.
    explicit DbgFmtCStr(CStr text) : text_(text) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    CStr text_;
};

// The bytes of a PStr. Null writes nothing.
class TESSEL_API DbgFmtPStr final : public DbgFmtToDebugStream {
public:
    // Keeps the address of the text.
    explicit DbgFmtPStr(ConstPStr text) : text_(text) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    ConstPStr text_;
};

// "0x" and at least eight lower-case hexadecimal digits.
class TESSEL_API DbgFmtPtr final : public DbgFmtToDebugStream {
public:
    // The value as an unsigned number of 32 bits.
    explicit DbgFmtPtr(int value) : value_(static_cast<unsigned int>(value)) {}
    // The value as it is.
    explicit DbgFmtPtr(unsigned int value) : value_(value) {}
    // The address.
    explicit DbgFmtPtr(const void* value) : value_(reinterpret_cast<uintptr_t>(value)) {}
    // The address.
    explicit DbgFmtPtr(const volatile void* value) : value_(reinterpret_cast<uintptr_t>(value)) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    uintptr_t value_;
};

// "0x" and at least eight lower-case hexadecimal digits.
class TESSEL_API DbgFmtHex final : public DbgFmtToDebugStream {
public:
    // The value as it is.
    explicit DbgFmtHex(uint32 value) : value_(value) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    uint32 value_;
};

// The four bytes of a code in memory order, a control character as a space.
class TESSEL_API DbgFmtQuadChar final : public DbgFmtToDebugStream {
public:
    // The code, whatever integer type it comes in.
    explicit DbgFmtQuadChar(int value) : value_(static_cast<uint32>(value)) {}
    // The code, whatever integer type it comes in.
    explicit DbgFmtQuadChar(unsigned int value) : value_(value) {}
    // The low 32 bits.
    explicit DbgFmtQuadChar(long value) : value_(static_cast<uint32>(value)) {}
    // The low 32 bits.
    explicit DbgFmtQuadChar(unsigned long value) : value_(static_cast<uint32>(value)) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    uint32 value_;
};

// "0x" and the identifier of a thread in lower-case hexadecimal digits; the calling thread's by default.
class TESSEL_API DbgFmtSysThreadID final : public DbgFmtToDebugStream {
public:
    // The calling thread.
    DbgFmtSysThreadID();
    // A thread by the host's identifier.
    explicit DbgFmtSysThreadID(uintptr_t threadID) : threadID_(threadID) {}
    void ToDebugStream(DebugStream& stream) const override;

private:
    uintptr_t threadID_;
};

// A number already formatted: at most 31 bytes of text, held here.
class TESSEL_API DbgFmtNum final : public DbgFmtToDebugStream {
public:
    // Copies the text; null is empty.
    explicit DbgFmtNum(CStr text) noexcept;
    void ToDebugStream(DebugStream& stream) const override;

private:
    char text_[32];
};

// A value in a format of the caller's, which must hold exactly one conversion, one that suits the type; else
// "__DbgFmtType: Bad Format__" is written. At most 31 bytes.
template <class T>
class DbgFmtType final : public DbgFmtToDebugStream {
    static_assert(std::is_scalar_v<T>, "a printf conversion takes a number or a pointer");

public:
    // Formats the value now; keeps neither the value nor the format.
    DbgFmtType(T value, CStr format) {
        if (VerifySingleFormatSpecifier(format))
            std::snprintf(text_, sizeof text_, format, value);
        else
            std::snprintf(text_, sizeof text_, "%s", "__DbgFmtType: Bad Format__");
    }
    void ToDebugStream(DebugStream& stream) const override { stream.Append(text_); }

private:
    char text_[32] = {};
};

// A report that is processed at the end of the statement that makes it.
class TESSEL_API DebugReport {
public:
    // Begins a report of the site.
    DebugReport(CStr file, int32 line, CStr identifier, _DebugOutputLevel level, uint32 siteCode);
    ~DebugReport();
    DebugReport(const DebugReport&) = delete;
    DebugReport& operator=(const DebugReport&) = delete;

    // Appends anything that some ToDebugStream takes. Found where the value's type is declared.
    template <class T>
    DebugReport& operator<<(const T& value) {
        ToDebugStream(stream_, value);
        return *this;
    }
    // The text so far, to append to by other means.
    DebugStream& Stream() { return stream_; }

private:
    DebugStream stream_;
};

}  // namespace tessel

// Makes a report: TESSEL_REPORT(level, siteCode) << ...; the site code is a constant of this place alone.
#    define TESSEL_REPORT(level, siteCode) ::tessel::DebugReport(__FILE__, __LINE__, __func__, (level), (siteCode))

#endif
#endif
