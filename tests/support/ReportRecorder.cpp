#include "support/ReportRecorder.h"

#include <algorithm>
#include <atomic>

namespace tessel::test {
namespace {

constexpr int32 kAnyLevel = -1;
std::atomic<ReportRecorder*> theRecorder{nullptr};

}  // namespace

ReportRecorder::ReportRecorder() : outerRecorder_(theRecorder), outerHandler_(DebugOutputGetHandler()) {
    theRecorder = this;
    DebugOutputSetHandler(Take);
}

ReportRecorder::~ReportRecorder() {
    DebugOutputSetHandler(outerHandler_);
    theRecorder = outerRecorder_;
}

void ReportRecorder::Take(CStr file, int32 line, CStr identifier, int32 level, uint32 siteCode, CStr text) {
    ReportRecorder& recorder = *theRecorder;
    std::lock_guard lock(recorder.mutex_);
    recorder.reports_.push_back({level, siteCode, text, file, line, identifier});
}

std::vector<Report> ReportRecorder::Reports() const {
    std::lock_guard lock(mutex_);
    return reports_;
}

std::vector<std::string> ReportRecorder::Texts() const {
    return Texts(kAnyLevel);
}

std::vector<std::string> ReportRecorder::Texts(int32 level) const {
    std::vector<std::string> texts;
    for (const Report& report : Reports())
        if (level == kAnyLevel || report.level == level) texts.push_back(report.text);
    return texts;
}

bool ReportRecorder::Has(int32 level, const std::string& text) const {
    const auto texts = Texts(level);
    return std::find(texts.begin(), texts.end(), text) != texts.end();
}

size_t ReportRecorder::Count() const {
    return Reports().size();
}

size_t ReportRecorder::CountAt(int32 level) const {
    return Texts(level).size();
}

void ReportRecorder::Clear() {
    std::lock_guard lock(mutex_);
    reports_.clear();
}

}  // namespace tessel::test
