// Takes the reports made while it lives, in place of the handler that was installed.
#pragma once

#include <tessel/diagnostics/DebugOutput.h>

#include <mutex>
#include <string>
#include <vector>

namespace tessel::test {

struct Report {
    int32 level;
    uint32 siteCode;
    std::string text;
    std::string file;
    int32 line;
    std::string identifier;
};

// One lives at a time, or they nest: the innermost takes the reports. Reports may come from any thread.
class ReportRecorder {
public:
    ReportRecorder();
    ~ReportRecorder();
    ReportRecorder(const ReportRecorder&) = delete;
    ReportRecorder& operator=(const ReportRecorder&) = delete;

    std::vector<Report> Reports() const;
    std::vector<std::string> Texts() const;             // of all reports, in order
    std::vector<std::string> Texts(int32 level) const;  // of one level
    bool Has(int32 level, const std::string& text) const;
    size_t Count() const;
    size_t CountAt(int32 level) const;
    void Clear();

private:
    static void Take(CStr file, int32 line, CStr identifier, int32 level, uint32 siteCode, CStr text);

    ReportRecorder* const outerRecorder_;
    const DebugOutputHandler outerHandler_;
    mutable std::mutex mutex_;  // guards the reports
    std::vector<Report> reports_;
};

}  // namespace tessel::test

