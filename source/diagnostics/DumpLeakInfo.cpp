#include "diagnostics/Guarded.h"
#include "platform/File.h"
#include "platform/LastError.h"
#include "platform/MemoryRead.h"
#include "platform/Process.h"
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
constexpr size_t kMostName = 560;  // of a location, and of a process's number

bool IsPrintable(char byte) {
    return byte >= ' ' && byte <= '~';
}

// Null when there is no such location.
std::unique_ptr<FileLoc> LocationOf(const char* fileName) {
    return GuardedOr(std::unique_ptr<FileLoc>(),
                     [&] { return std::unique_ptr<FileLoc>(CreateFileLoc(FileLoc::kTempFolder, fileName, false)); });
}

platform::FileHandle CreateFile(const char* name) {
    return GuardedOr(platform::kNoFile, [&] { return platform::FileCreatePrivate(name, platform::kWrite); });
}

// A name of this process's own: its number before the extension.
void OwnName(const char* name, char (&own)[kMostName]) {
    const char* const dot = std::strrchr(name, '.');
    const bool hasExtension = dot && !std::strchr(dot, '\\');
    const int length = hasExtension ? static_cast<int>(dot - name) : static_cast<int>(std::strlen(name));
    std::snprintf(own, kMostName, "%.*s.%u%s", length, name, platform::ProcessId(), name + length);
}

// The name becomes that of the file. Another program that ends at the same time has its own.
platform::FileHandle CreateReport(char (&name)[kMostName]) {
    platform::FileHandle file = CreateFile(name);
    const platform::ErrorNumber error = file == platform::kNoFile ? platform::LastError() : platform::kErrorSuccess;
    if (error != platform::kErrorSharingViolation && error != platform::kErrorAccessDenied) return file;
    char own[kMostName];
    OwnName(name, own);
    file = CreateFile(own);
    if (file != platform::kNoFile) std::memcpy(name, own, sizeof own);
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
    const int length = std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    isCut_ = isCut_ || length >= static_cast<int>(sizeof text);
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

void LeakDumper::WriteReport(AllocTracker& tracker, int32 count) {
    const auto location = LocationOf(fileName_);
    if (!location) {
        TESSEL_REPORT(kDebugError, 0x7D15C2E8u) << "There is no place for the report of the " << name_;
        return;
    }
    char name[kMostName];
    std::snprintf(name, sizeof name, "%s", location->PathText());
    file_ = CreateReport(name);
    const platform::ErrorNumber error = platform::LastError();
    TESSEL_REPORT(kDebugInfo, 0x1D9A7C03u)
        << name << "(1) : " << count << ' ' << name_ << " (" << expected_ << " expected)";
    if (file_ == platform::kNoFile) {
        TESSEL_REPORT(kDebugError, 0x53B7E21Du) << "Cannot write " << name << ": " << platform::ErrorText(error);
        return;
    }
    tracker.DumpAll(this);
    isCut_ = isCut_ || !isBegun_;  // there was no memory for it
    CloseFile();
    if (isCut_) TESSEL_REPORT(kDebugError, 0xA90C4F76u) << name << " could not be written whole";
}

void LeakDumper::DumpLeaks(AllocTracker& tracker) {
    const int32 count = tracker.CountUnreported();
    if (count <= expected_) {
        TESSEL_REPORT(kDebugInfo, 0x60B8D2F1u) << "Total " << name_ << " = " << count << ".\n";
        return;
    }
    WriteReport(tracker, count);
    TESSEL_REPORT(kDebugError, 0x48E5B09Cu)
        << "We got " << int64{count} - expected_ << " more " << name_ << " than we see from a basic launch and quit.\n";
}

// Texts are small and many, so they are gathered.
void LeakDumper::WriteToFile(const char* text) {
    const size_t length = std::strlen(text);
    isBegun_ = true;
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
