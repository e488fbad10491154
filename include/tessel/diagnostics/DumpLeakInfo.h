// Leak reports: what is still living in a tracker, written to a text file and summed up in a report.
#ifndef TESSEL_DIAGNOSTICS_DUMPLEAKINFO_H
#define TESSEL_DIAGNOSTICS_DUMPLEAKINFO_H

#include <tessel/diagnostics/AllocTracker.h>

TESSEL_BEGIN_C

// Reports the unreported records of a tracker (null: does nothing). When there are more than expected, each is written
// to the named file in the system's temporary folder, and a level-3 report tells how many more; else a level-0 report
// tells the total. The file is created afresh and readable by the user alone, since it shows what the objects hold. No
// link is followed. Where the name is another user's, or another program that runs at the same time has written its own
// report under it, the number of this process comes before the extension ("leaks.1234.txt"). That no file, or not all
// of it, could be written is reported (level 3). Neither atomic nor durable. Any thread.
TESSEL_API void DumpLeakInfo(AllocTrackerPtr tracker, int32 expected, CStr name, CStr fileName);

TESSEL_END_C

#ifdef __cplusplus

namespace tessel {

// Writes a leak report. The texts are kept by address.
class TESSEL_API LeakDumper : public AllocDumper {
public:
    // For a report that expects so many records. The file is made by DumpLeaks.
    LeakDumper(int32 expected, const char* name, const char* fileName);
    ~LeakDumper() override;
    LeakDumper(const LeakDumper&) = delete;
    LeakDumper& operator=(const LeakDumper&) = delete;

    const char* ObjBeingTrackedName() override;
    bool GetShowStackNames() override;
    // Writes to the open file, else to a level-0 report.
    void FormatToOutput(const char* format, ...) override __attribute__((format(printf, 2, 3)));
    // At most 254 bytes, each that cannot be printed as ".". Of an object that cannot be read, none.
    void DumpItemContents(const void* address, uint32 size) override;

    // The report described at DumpLeakInfo.
    void DumpLeaks(AllocTracker& tracker);

private:
    void WriteReport(AllocTracker& tracker, int32 count);
    void WriteToFile(const char* text);
    void FlushFile();
    void CloseFile();

    const char* name_;
    const char* fileName_;
    int32 expected_;
    intptr_t file_ = 0;  // the open output file; 0: none
    bool isBegun_ = false;
    bool isCut_ = false;  // something could not be written
    size_t buffered_ = 0;
    char buffer_[8192];
};

}  // namespace tessel

#endif
#endif
