// The string classes: OVString owns a text, OVSubString is a view of one wherever it lives, OVTempString is a text for
// the moment.
#ifndef TESSEL_STRINGS_OVSTRING_H
#define TESSEL_STRINGS_OVSTRING_H

#include <tessel/base/MgErr.h>
#include <tessel/base/StringTypes.h>
#include <tessel/strings/BSTR.h>
#include <tessel/strings/ovhandle.h>

#include <stdarg.h>

#ifdef __cplusplus
#    include <string>

namespace tessel {

// An owned text, kept in an LStr handle; empty without one. Used by one thread at a time.
class TESSEL_API OVString : public OVHandle {
public:
    OVString() = default;

    LStrHandle LHandle() const { return reinterpret_cast<LStrHandle>(Handle()); }
    int32 Length() const;
    const uint8* Bytes() const;  // null when empty

    // Makes the text n bytes long; new bytes are not set, n of 0 releases the handle. kArgErr for a negative n, else
    // the handle manager's error.
    MgErr Resize(int32 n);

    MgErr Assign(const void* bytes, int32 n);

    // At most size - 1 bytes and a terminator; a size below 1 is reported and nothing is written.
    void CopyToCStr(char* buffer, int32 size) const;
    void CopyToPStr(PStr buffer) const;  // at most 255 bytes
    MgErr CopyToNarrowString(std::string& out) const;

    // Replace the text by, or append to it, what the format gives (strings/StringFmtPrint.h).
    MgErr Printf(CStr format, ...);
    MgErr Printf(const unsigned char* format, ...);
    MgErr AppendPrintf(CStr format, ...);
    MgErr AppendPrintf(const unsigned char* format, ...);
};

// A view of a run of bytes that knows where they live and can therefore edit them there. The storage kind (m_class):
//
//    1  2  3  7   any text owned elsewhere: read-only
//    4            a PStr buffer of 256 bytes: up to 254, length byte and a terminating zero kept; one that holds 255
//                 bytes is left as it is, and viewed whole, until it is edited
//    5            a caller's buffer: up to capacity - 1, kept terminated
//   10            an OVString or an LStr handle: any length
//   11            an element of a CPStr handle: up to 255, the later elements moved
//   12            the buffers of an OVTempString: any length
//
// The storage must outlive the view. An edit makes other views of the same storage stale. Lengths and offsets are
// bytes; case is mapped with ToLower. An editing operation returns kArgErr, the text unchanged, when the text is
// read-only or cannot hold the result, and the handle manager's error when memory is short. Texts put in, printed
// or searched for may come from the view itself. Used by one thread at a time.
class TESSEL_API OVSubString {
public:
    // Read-only views; null is the empty text.
    OVSubString(CStr text);
    OVSubString(const void* bytes, int32 length);
    OVSubString(const OVString& string);
    OVSubString(LStrHandle handle);
    OVSubString(const LStr* text);

    // Views to edit. A buffer's text is its first `length` bytes, else what is before its terminator.
    OVSubString(int32 capacity, char* buffer);
    OVSubString(int32 capacity, char* buffer, int32 length);
    explicit OVSubString(OVString* string);
    explicit OVSubString(LStrHandle* handle);
    OVSubString(CPStrHandle list, int32 index);
    static OVSubString OnPStr(PStr buffer);

    const uint8* Bytes() const { return bytes_; }
    int32 Length() const { return length_; }
    int32 Class() const { return m_class; }

    // ---- editing ----------------------------------------------------------------------------------------------------

    // New bytes are not set.
    MgErr Resize(int32 n);

    MgErr Assign(const void* bytes, int32 n);
    MgErr Assign(const LStr* text);
    MgErr Assign(LStrHandle text);
    MgErr Assign(const OVString& text);
    MgErr Assign(const OVSubString& text);
    MgErr AssignCStr(CStr text);
    MgErr AssignPStr(ConstPStr text);

    // Wide text is converted to the active code page. A length below 1 is the BSTR's own.
    MgErr AssignBSTR(const char16_t* text, int32 length);

    // Replaces `count` bytes at offset `at`; an offset outside the text is its end. A count that does not fit the text
    // is reported and gives kArgErr. A null source makes room and leaves it unset.
    MgErr Replace(const void* source, int32 length, int32 at, int32 count);
    MgErr Replace(const OVSubString& source, int32 at, int32 count);
    MgErr ReplaceCStr(CStr source, int32 at, int32 count);
    MgErr ReplaceBSTR(const char16_t* source, int32 length, int32 at, int32 count);

    MgErr Insert(const void* source, int32 length, int32 at);
    MgErr Insert(const OVSubString& source, int32 at);
    MgErr InsertCStr(CStr source, int32 at);

    MgErr Append(const void* source, int32 length);
    MgErr Append(const OVSubString& source);
    MgErr AppendCStr(CStr source);
    MgErr AppendBSTR(const char16_t* source, int32 length);

    // Replaces every occurrence, counted in *count (may be null). The next occurrence may begin before or inside of
    // what was just inserted, but ends behind it. An empty `find` replaces nothing. All or nothing: on failure the text
    // is as it was, and the count 0.
    MgErr SearchReplace(const OVSubString& find, const OVSubString& replacement, int32* count);

    // Narrows the view past spaces, tabs, CR and LF at both ends. The stored bytes stay until the view is resized,
    // which makes its text all that is stored.
    void TrimWhitespace();

    MgErr Printf(CStr format, ...);
    MgErr Printf(const unsigned char* format, ...);
    MgErr AppendPrintf(CStr format, ...);
    MgErr AppendPrintf(const unsigned char* format, ...);

    // ---- comparing and searching ------------------------------------------------------------------------------------

    // Negative, zero or positive: the first difference of bytes, else of lengths; -1 or 1 against an empty text.
    int32 Compare(const void* bytes, int32 length) const;
    int32 Compare(const OVSubString& text) const;
    int32 CompareCStr(CStr text) const;
    int32 CompareNC(const void* bytes, int32 length) const;
    int32 CompareNC(const OVSubString& text) const;
    int32 CompareNCCStr(CStr text) const;

    // Offset of the first byte at or after `start` that is in the set, or -1.
    int32 FindFirstOf(const void* set, int32 length, int32 start) const;
    int32 FindFirstOf(const OVSubString& set, int32 start) const;
    int32 FindFirstOfCStr(CStr set, int32 start) const;

    // Offset of the first occurrence at or after `start`, or -1; an empty pattern has none.
    int32 Search(const OVSubString& pattern, int32 start) const;
    int32 SearchCStr(CStr pattern, int32 start) const;
    int32 SearchNC(const OVSubString& pattern, int32 start) const;
    int32 SearchNCCStr(CStr pattern, int32 start) const;

    // ---- copying out, as of OVString --------------------------------------------------------------------------------

    void CopyToCStr(char* buffer, int32 size) const;
    void CopyToPStr(PStr buffer) const;
    MgErr CopyToNarrowString(std::string& out) const;

protected:
    struct TempRecord;

    // An element of a list.
    struct Element {
        CPStrHandle list;
        int32 index;
    };

    OVSubString(const void* bytes, int32 length, int32 storageClass);

    uint8* bytes_;
    int32 length_;
    int32 one_ = 1;
    int32 m_class;
    union {
        PStr pstr_;           // 4
        int32 capacity_;      // 5
        LStrHandle* handle_;  // 10
        Element element_;     // 11
        TempRecord* temp_;    // 12
    };
    int32 skipped_ = 0;  // bytes of the storage before the view

private:
    MgErr ResizePStr(int32 n);
    MgErr ResizeBuffer(int32 n);
    MgErr ResizeHandle(int32 n);
    MgErr ResizeElement(int32 n);
    MgErr ResizeTemp(int32 n);
    void MoveToStart(uint8* start);
    bool IsInStorage(const void* bytes, int32 length) const;
    template <class Edit>
    MgErr WithoutOverlap(const void* source, int32 length, Edit edit);
    MgErr ReplaceRange(const void* source, int32 length, int32 at, int32 count);

    friend TESSEL_API MgErr OVSubStringPrintf(OVSubString* string, bool append, CStr format, va_list args);
};

// The text and room of an OVTempString.
struct OVSubString::TempRecord {
    int32 inHandle = 0;  // whether the text is in `overflow`
    OVString overflow;
    uint8 room[256];
};

// An empty text of any length for the moment: up to 255 bytes take no memory beyond the object.
class TESSEL_API OVTempString : public OVSubString {
public:
    OVTempString();
    OVTempString(const OVTempString&) = delete;
    OVTempString& operator=(const OVTempString&) = delete;

private:
    TempRecord record_;
};

// What Printf (append false) and AppendPrintf of both classes do. Null is reported and gives kArgErr.
TESSEL_API MgErr OVSubStringPrintf(OVSubString* string, bool append, CStr format, va_list args);

}  // namespace tessel
#endif

#endif
