// The destinations of printed text: console, debugger, file, and two at once.
#include "diagnostics/Guarded.h"
#include "platform/Debugger.h"
#include "platform/File.h"
#include "platform/Mutex.h"
#include <tessel/diagnostics/FileLoc.h>
#include <tessel/strings/StringFmtPrint.h>
#include <tessel/strings/StringOutput.h>

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <new>
#include <string>

namespace tessel {
namespace {

// The "StringOutputWinConsole" lock. A plain mutex, since an output may be made before the library starts.
platform::Mutex consoleLock;
int32 consoleCount TESSEL_GUARDED_BY(consoleLock) = 0;
bool consoleIsOurs TESSEL_GUARDED_BY(consoleLock) = false;

FILE* Stream(void* stream) {
    return static_cast<FILE*>(stream);
}

// Null when it cannot be opened.
FILE* OpenStream(CStr name, bool append) {
    return GuardedOr(static_cast<FILE*>(nullptr), [&] { return platform::FileOpenStream(name, append); });
}

}  // namespace

void StringOutput::Open(OpenMode) {
}
void StringOutput::Flush() {
}

// ---- StringOutputBase -----------------------------------------------------------------------------------------------

int32 StringOutputBase::PrintData(CStr format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int32 prints = PrintDataV(format, arguments);
    va_end(arguments);
    return prints;
}

int32 StringOutputBase::PrintDataV(CStr format, va_list arguments) {
    if (!format || busy_.exchange(true)) return prints_;
    WriteFormatted(format, arguments);
    ++prints_;
    busy_ = false;
    return prints_;
}

int32 StringOutputBase::vsnprintf(char* buffer, int32 size, CStr format, va_list arguments) {
    if (size <= 0) return 0;
    const int32 length = SPrintfv(buffer, size - 1, format, static_cast<int32>(std::strlen(format)), arguments);
    buffer[length] = 0;
    return length;
}

// ---- StringOutputWinConsole -----------------------------------------------------------------------------------------

StringOutputWinConsole::StringOutputWinConsole() {
    platform::MutexHolder hold(consoleLock);
    ++consoleCount;
    if (platform::ConsoleAllocate()) consoleIsOurs = true;
}

StringOutputWinConsole::~StringOutputWinConsole() {
    platform::MutexHolder hold(consoleLock);
    if (--consoleCount > 0) return;
    if (consoleIsOurs) platform::ConsoleFree();
    consoleIsOurs = false;
}

void StringOutputWinConsole::WriteFormatted(CStr format, va_list arguments) {
    const int32 length = vsnprintf(buffer_, kBufferSize, format, arguments);
    platform::ConsoleOutput(buffer_, static_cast<size_t>(length));
}

// ---- StringOutputWinDebugStr ----------------------------------------------------------------------------------------

void StringOutputWinDebugStr::WriteFormatted(CStr format, va_list arguments) {
    vsnprintf(buffer_, kBufferSize, format, arguments);
    platform::DebuggerOutput(buffer_);
}

// ---- StringOutputFile -----------------------------------------------------------------------------------------------

StringOutputFile::~StringOutputFile() {
    Close();
    delete location_;
}

void StringOutputFile::Open(OpenMode mode) {
    Close();
    if (!location_) return;
    FILE* const stream = OpenStream(location_->PathText(), mode != kTruncate);
    if (stream && mode == kAppendAtEnd) std::fseek(stream, 0, SEEK_END);
    stream_ = stream;
}

void StringOutputFile::Close() {
    if (stream_) std::fclose(Stream(stream_));
    stream_ = nullptr;
}

void StringOutputFile::Flush() {
    if (stream_) std::fflush(Stream(stream_));
}

void StringOutputFile::WriteFormatted(CStr format, va_list arguments) {
    if (!stream_) return;
    const int32 length = vsnprintf(buffer_, kBufferSize, format, arguments);
    std::fwrite(buffer_, 1, static_cast<size_t>(length), Stream(stream_));
}

// ---- StringOutputFork -----------------------------------------------------------------------------------------------

StringOutputFork::~StringOutputFork() {
    if (!owns_) return;
    delete first_;
    delete second_;
}

void StringOutputFork::Open(OpenMode mode) {
    if (first_) first_->Open(mode);
    if (second_) second_->Open(mode);
}

int32 StringOutputFork::PrintData(CStr format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int32 prints = PrintDataV(format, arguments);
    va_end(arguments);
    return prints;
}

int32 StringOutputFork::PrintDataV(CStr format, va_list arguments) {
    int32 prints = 0;
    if (first_) {
        va_list copy;
        va_copy(copy, arguments);
        prints = first_->PrintDataV(format, copy);
        va_end(copy);
    }
    return second_ ? second_->PrintDataV(format, arguments) : prints;
}

void StringOutputFork::Flush() {
    if (first_) first_->Flush();
    if (second_) second_->Flush();
}

// ---- StringOutputFactory --------------------------------------------------------------------------------------------

StringOutput* StringOutputFactory::CreateDebugPrintOutput() {
    return new (std::nothrow) StringOutputWinDebugStr;
}
StringOutput* StringOutputFactory::CreateConsoleOutput() {
    return new (std::nothrow) StringOutputWinConsole;
}
StringOutput* StringOutputFactory::CreateFileOutput(FileLoc* location) {
    return new (std::nothrow) StringOutputFile(location);
}

}  // namespace tessel
