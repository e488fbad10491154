#include "diagnostics/Guarded.h"
#include "platform/File.h"
#include "platform/LastError.h"
#include "platform/MemoryRead.h"
#include <tessel/diagnostics/DebugStream.h>
#include <tessel/diagnostics/DumpLeakInfo.h>
#include <tessel/diagnostics/FileLoc.h>

#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <memory>

namespace tessel {
namespace {

constexpr size_t kMostContents = 254;

bool IsPrintable(char byte) {
    return byte >= ' ' && byte <= '~';
}

// Null when there is no such location.
std::unique_ptr<FileLoc> LocationOf(const char* fileName) {
    return GuardedOr(std::unique_ptr<FileLoc>(),
                     [&] { return std::unique_ptr<FileLoc>(CreateFileLoc(FileLoc::kTempFolder, fileName, false)); });
}

platform::FileHandle CreateFile(const char* name) {
    const platform::FileHandle file =
        GuardedOr(platform::kNoFile, [&] { return platform::FileCreatePrivate(name, platform::kWrite); });
    if (file == platform::kNoFile)
        TESSEL_REPORT(kDebugWarning, 0x53B7E21Du) << "Cannot write " << name << ": error " << platform::LastError()
                                                  << ". The name may be taken by another user's file.";
    return file;
}

}  // namespace

LeakDumper::LeakDumper(int32 expected, const char* name, const char* fileName)
    : name_(name ? name : ""), fileName_(fileName), expected_(expected) {
}

LeakDumper::~LeakDumper() {
    CloseFile();
}

const char* LeakDumper::ObjBeingTrackedName() {
    return name_;
}
bool LeakDumper::GetShowStackNames() {
    return true;
}

void LeakDumper::FormatToOutput(const char* format, ...) {
    char text[2048];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    if (file_ != platform::kNoFile)
        WriteToFile(text);
    else
        TESSEL_REPORT(kDebugInfo, 0x34C1F6A8u) << text;
}

void LeakDumper::DumpItemContents(const void* address, uint32 size) {
    char contents[kMostContents + 1];
    const size_t count = platform::ReadMemory(address, contents, size < kMostContents ? size : kMostContents);
    for (size_t i = 0; i < count; ++i)
        if (!IsPrintable(contents[i])) contents[i] = '.';
    contents[count] = 0;
    FormatToOutput("Memory Contents: %s\n", contents);
}

void LeakDumper::DumpLeaks(AllocTracker& tracker) {
    const int32 count = tracker.CountUnreported();
    if (count <= expected_) {
        TESSEL_REPORT(kDebugInfo, 0x60B8D2F1u) << "Total " << name_ << " = " << count << ".\n";
        return;
    }
    if (const auto location = LocationOf(fileName_)) {
        TESSEL_REPORT(kDebugInfo, 0x1D9A7C03u)
            << location->PathText() << "(1) : " << count << ' ' << name_ << " (" << expected_ << " expected)";
        file_ = CreateFile(location->PathText());
        if (file_ != platform::kNoFile) tracker.DumpAll(this);
        CloseFile();
        if (isCut_) TESSEL_REPORT(kDebugWarning, 0xA90C4F76u) << location->PathText() << " could not be written whole";
    }
    TESSEL_REPORT(kDebugError, 0x48E5B09Cu)
        << "We got " << int64{count} - expected_ << " more " << name_ << " than we see from a basic launch and quit.\n";
}

// Texts are small and many, so they are gathered.
void LeakDumper::WriteToFile(const char* text) {
    const size_t length = std::strlen(text);
    if (length > sizeof buffer_ - buffered_) FlushFile();
    std::memcpy(buffer_ + buffered_, text, length);
    buffered_ += length;
}

void LeakDumper::FlushFile() {
    size_t written;
    isCut_ = isCut_ || !platform::FileWrite(file_, buffer_, buffered_, written);
    buffered_ = 0;
}

void LeakDumper::CloseFile() {
    if (file_ == platform::kNoFile) return;
    FlushFile();
    isCut_ = !platform::FileClose(file_) || isCut_;
    file_ = platform::kNoFile;
}

}  // namespace tessel

void DumpLeakInfo(AllocTrackerPtr tracker, int32 expected, CStr name, CStr fileName) {
    if (tracker) tessel::LeakDumper(expected, name, fileName).DumpLeaks(*tracker);
}
