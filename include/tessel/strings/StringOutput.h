// String outputs: objects that write formatted text to the console, to the debugger channel, to a file, or to two such
// outputs at once. The format language is that of strings/StringFmtPrint.h.
#ifndef TESSEL_STRINGS_STRINGOUTPUT_H
#define TESSEL_STRINGS_STRINGOUTPUT_H

#include <tessel/base/StringTypes.h>
#include <tessel/memory/TrackedMallocFree.h>

#ifdef __cplusplus
#    include <atomic>
#    include <cstdarg>

namespace tessel {

class FileLoc;

// Where formatted text goes. One output belongs to one thread at a time.
class TESSEL_API StringOutput : public TrackedObject {
public:
    // How a file is opened. Any other value appends.
    enum OpenMode : int32 { kTruncate = 0, kAppendAtEnd = 1 };

    virtual ~StringOutput() = default;
    // Opens what is to be opened; nothing for outputs that need no opening.
    virtual void Open(OpenMode mode);
    // Print one piece of text of at most 2047 bytes; return how many prints there were so far.
    virtual int32 PrintData(CStr format, ...) = 0;
    // The same from an argument list.
    virtual int32 PrintDataV(CStr format, va_list arguments) = 0;
    // Sends on what is held back.
    virtual void Flush();
};

// Counts the prints, and drops one that is made while another is under way (by a report raised while printing).
class TESSEL_API StringOutputBase : public StringOutput {
public:
    int32 PrintData(CStr format, ...) override;
    int32 PrintDataV(CStr format, va_list arguments) override;

protected:
    static constexpr int32 kBufferSize = 2048;

    // Formats the text and sends it where it belongs.
    virtual void WriteFormatted(CStr format, va_list arguments) = 0;

    // Formats into a buffer of `size` bytes, at most size - 1 and a terminator; returns the length.
    static int32 vsnprintf(char* buffer, int32 size, CStr format, va_list arguments);

private:
    int32 prints_ = 0;
    std::atomic<bool> busy_{false};
};

// Writes to the console, which it makes when there is none; the last such output takes it away again.
class TESSEL_API StringOutputWinConsole final : public StringOutputBase {
public:
    // Makes the console when there is none.
    StringOutputWinConsole();
    ~StringOutputWinConsole() override;

private:
    void WriteFormatted(CStr format, va_list arguments) override;

    char buffer_[kBufferSize];
};

// Writes to the debugger channel.
class TESSEL_API StringOutputWinDebugStr final : public StringOutputBase {
private:
    void WriteFormatted(CStr format, va_list arguments) override;

    char buffer_[kBufferSize];
};

// Writes to a file once it is open; prints nothing before, or when it cannot be opened.
class TESSEL_API StringOutputFile final : public StringOutputBase {
public:
    // Takes the location over.
    explicit StringOutputFile(FileLoc* location) : location_(location) {}
    ~StringOutputFile() override;
    void Open(OpenMode mode) override;
    void Flush() override;

private:
    void WriteFormatted(CStr format, va_list arguments) override;
    void Close();

    void* stream_ = nullptr;  // null while it is not open
    FileLoc* location_;
    char buffer_[kBufferSize];
};

// Passes everything on to one output and then to another; either may be null.
class TESSEL_API StringOutputFork final : public StringOutput {
public:
    // `owns`: deletes both at its end.
    StringOutputFork(StringOutput* first, StringOutput* second, bool owns)
        : first_(first), second_(second), owns_(owns) {}
    ~StringOutputFork() override;
    StringOutputFork(const StringOutputFork&) = delete;
    StringOutputFork& operator=(const StringOutputFork&) = delete;

    // Opens both.
    void Open(OpenMode mode) override;
    // The result is the second output's, without one the first's.
    int32 PrintData(CStr format, ...) override;
    int32 PrintDataV(CStr format, va_list arguments) override;
    // Flushes both.
    void Flush() override;

private:
    StringOutput* first_;
    StringOutput* second_;
    bool owns_;
};

// Makes outputs, owned by the caller. Null when memory runs out.
class TESSEL_API StringOutputFactory {
public:
    // An output to the debugger channel.
    static StringOutput* CreateDebugPrintOutput();
    // An output to the console.
    static StringOutput* CreateConsoleOutput();
    // Takes the location over, unless it returns null.
    static StringOutput* CreateFileOutput(FileLoc* location);
};

}  // namespace tessel

#endif
#endif
