// The location of a file that diagnostics write to.
#ifndef TESSEL_DIAGNOSTICS_FILELOC_H
#define TESSEL_DIAGNOSTICS_FILELOC_H

#include <tessel/base/Types.h>

#ifdef __cplusplus

namespace tessel {

// A file name, as the library hands names to the system ("C:\dir\file").
class TESSEL_API FileLoc {
public:
    // Where a name lies. Any code but these three takes the name as the full location.
    enum LocCode : int32 { kFullName = -1, kTempFolder0 = 0, kTempFolder2 = 2, kTempFolder = 4 };

    virtual ~FileLoc();
    // A new object with the same text, owned by the caller.
    virtual FileLoc* Clone() const = 0;
    // The text, which lives as long as the object.
    virtual const char* PathText() const = 0;
};

// A location in the form of the host's names.
class TESSEL_API Win32FileLoc final : public FileLoc {
public:
    // Puts the name into the system's temporary folder for the codes 0, 2 and 4. Raises OVExcept 7 when it does not
    // fit.
    Win32FileLoc(int32 code, const char* name);
    FileLoc* Clone() const override;
    const char* PathText() const override;

    // Appends ".txt". Raises OVExcept 7 when the text is longer than 511 bytes.
    void AddTxt();

private:
    static constexpr size_t kMostText = 516;
    char text_[kMostText + 1];
};

// A location, owned by the caller. ".txt" is appended when asked for. Raises OVExcept: 1 for a null name, 7 when the
// result is too long, 2 when memory runs out.
TESSEL_API FileLoc* CreateFileLoc(int32 code, const char* fileName, bool addTxt);

}  // namespace tessel

#endif
#endif
