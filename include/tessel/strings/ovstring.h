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

    // The handle, which stays the string's; null when empty.
    LStrHandle LHandle() const { return reinterpret_cast<LStrHandle>(Handle()); }
    // Bytes of the text.
    int32 Length() const;
    // The bytes of the text; null when empty.
    const uint8* Bytes() const;

    // Makes the text n bytes long; new bytes are not set, n of 0 releases the handle. kArgErr for a negative n, else
    // the handle manager's error.
    MgErr Resize(int32 n);

    // Makes the text these bytes, which may be part of it. Errors as of Resize.
    MgErr Assign(const void* bytes, int32 n);

    // At most size - 1 bytes and a terminator; a size below 1 is reported and nothing is written.
    void CopyToCStr(char* buffer, int32 size) const;
    // The first 255 bytes at most.
    void CopyToPStr(PStr buffer) const;
    // The text as a std::string. kMemFullErr when memory is short.
    MgErr CopyToNarrowString(std::string& out) const;

    // Replace the text by, or append to it, what the format gives (strings/StringFmtPrint.h).
    MgErr Printf(CStr format, ...);
    // The same with the format in a PStr.
    MgErr Printf(const unsigned char* format, ...);
    // Appends what the format gives.
    MgErr AppendPrintf(CStr format, ...);
    // Appends what the format, in a PStr, gives.
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
    // Bytes; a negative length is 0.
    OVSubString(const void* bytes, int32 length);
    // The text of a string.
    OVSubString(const OVString& string);
    // The text of a string handle.
    OVSubString(LStrHandle handle);
    // The text of an LStr.
    OVSubString(const LStr* text);

    // Views to edit. A buffer's text is its first `length` bytes, else what is before its terminator.
    OVSubString(int32 capacity, char* buffer);
    // A buffer whose text is its first `length` bytes.
    OVSubString(int32 capacity, char* buffer, int32 length);
    // A string, edited in its handle.
    explicit OVSubString(OVString* string);
    // A string handle, which is made when it is null and needed.
    explicit OVSubString(LStrHandle* handle);
    // An element of a list.
    OVSubString(CPStrHandle list, int32 index);
    // A PStr buffer of 256 bytes.
    static OVSubString OnPStr(PStr buffer);

    // The bytes of the view.
    const uint8* Bytes() const { return bytes_; }
    // Bytes of the view.
    int32 Length() const { return length_; }
    // The storage kind.
    int32 Class() const { return m_class; }

    // ---- editing ----------------------------------------------------------------------------------------------------

    // New bytes are not set.
    MgErr Resize(int32 n);

    // Replaces the text by these bytes.
    MgErr Assign(const void* bytes, int32 n);
    // Replaces the text by that of an LStr.
    MgErr Assign(const LStr* text);
    // Replaces the text by that of a string handle.
    MgErr Assign(LStrHandle text);
    // Replaces the text by that of a string.
    MgErr Assign(const OVString& text);
    // Replaces the text by that of a view.
    MgErr Assign(const OVSubString& text);
    // Replaces the text by that of a CStr.
    MgErr AssignCStr(CStr text);
    // Replaces the text by that of a PStr.
    MgErr AssignPStr(ConstPStr text);

    // Wide text is converted to the active code page. A length below 1 is the BSTR's own.
    MgErr AssignBSTR(const char16_t* text, int32 length);

    // Replaces `count` bytes at offset `at`; an offset outside the text is its end. A count that does not fit the text
    // is reported and gives kArgErr. A null source makes room and leaves it unset.
    MgErr Replace(const void* source, int32 length, int32 at, int32 count);
    // Replaces bytes by the text of a view.
    MgErr Replace(const OVSubString& source, int32 at, int32 count);
    // Replaces bytes by a CStr.
    MgErr ReplaceCStr(CStr source, int32 at, int32 count);
    // Replaces bytes by wide text; a length below 1 is the BSTR's own.
    MgErr ReplaceBSTR(const char16_t* source, int32 length, int32 at, int32 count);

    // Inserts bytes at an offset; one outside the text is its end.
    MgErr Insert(const void* source, int32 length, int32 at);
    // Inserts the text of a view.
    MgErr Insert(const OVSubString& source, int32 at);
    // Inserts a CStr.
    MgErr InsertCStr(CStr source, int32 at);

    // Appends bytes.
    MgErr Append(const void* source, int32 length);
    // Appends the text of a view.
    MgErr Append(const OVSubString& source);
    // Appends a CStr.
    MgErr AppendCStr(CStr source);
    // Appends wide text; a length below 1 is the BSTR's own.
    MgErr AppendBSTR(const char16_t* source, int32 length);

    // Replaces every occurrence, counted in *count (may be null). The next occurrence may begin before or inside of
    // what was just inserted, but ends behind it. An empty `find` replaces nothing. All or nothing: on failure the text
    // is as it was, and the count 0.
    MgErr SearchReplace(const OVSubString& find, const OVSubString& replacement, int32* count);

    // Narrows the view past spaces, tabs, CR and LF at both ends. The stored bytes stay until the view is resized,
    // which makes its text all that is stored.
    void TrimWhitespace();

    // Replaces the text by what the format gives (strings/StringFmtPrint.h).
    MgErr Printf(CStr format, ...);
    // The same with the format in a PStr.
    MgErr Printf(const unsigned char* format, ...);
    // Appends what the format gives.
    MgErr AppendPrintf(CStr format, ...);
    // The same with the format in a PStr.
    MgErr AppendPrintf(const unsigned char* format, ...);

    // ---- comparing and searching ------------------------------------------------------------------------------------

    // Negative, zero or positive: the first difference of bytes, else of lengths; -1 or 1 against an empty text.
    int32 Compare(const void* bytes, int32 length) const;
    // As above, with the text of a view.
    int32 Compare(const OVSubString& text) const;
    // As above, with a CStr.
    int32 CompareCStr(CStr text) const;
    // As Compare, without regard to case.
    int32 CompareNC(const void* bytes, int32 length) const;
    // As above, with the text of a view.
    int32 CompareNC(const OVSubString& text) const;
    // As above, with a CStr.
    int32 CompareNCCStr(CStr text) const;

    // Offset of the first byte at or after `start` that is in the set, or -1.
    int32 FindFirstOf(const void* set, int32 length, int32 start) const;
    // The same with the bytes of a view as the set.
    int32 FindFirstOf(const OVSubString& set, int32 start) const;
    // The same with the bytes of a CStr as the set.
    int32 FindFirstOfCStr(CStr set, int32 start) const;

    // Offset of the first occurrence at or after `start`, or -1; an empty pattern has none.
    int32 Search(const OVSubString& pattern, int32 start) const;
    // The same for a CStr.
    int32 SearchCStr(CStr pattern, int32 start) const;
    // The same without regard to case.
    int32 SearchNC(const OVSubString& pattern, int32 start) const;
    // The same for a CStr, without regard to case.
    int32 SearchNCCStr(CStr pattern, int32 start) const;

    // ---- copying out, as of OVString --------------------------------------------------------------------------------

    // At most size - 1 bytes and a terminator; a size below 1 is reported and nothing is written.
    void CopyToCStr(char* buffer, int32 size) const;
    // The first 255 bytes at most.
    void CopyToPStr(PStr buffer) const;
    // The text as a std::string. kMemFullErr when memory is short.
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
    // An empty text.
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
