// A dumper that gathers what is written.
#pragma once

#include <tessel/diagnostics/AllocTracker.h>

#include <cstdarg>
#include <cstdio>
#include <string>

namespace tessel::test {

class TextDumper : public AllocDumper {
public:
    explicit TextDumper(const char* name = "things", bool stacks = false) : name_(name), stacks_(stacks) {}
    const char* ObjBeingTrackedName() override { return name_; }
    bool GetShowStackNames() override { return stacks_; }
    __attribute__((format(printf, 2, 3))) void FormatToOutput(const char* format, ...) override {
        char piece[2048];
        va_list arguments;
        va_start(arguments, format);
        std::vsnprintf(piece, sizeof piece, format, arguments);
        va_end(arguments);
        text += piece;
    }
    void DumpItemContents(const void*, uint32 size) override { FormatToOutput("<%u bytes>\n", size); }

    std::string text;

private:
    const char* name_;
    bool stacks_;
};

}  // namespace tessel::test

