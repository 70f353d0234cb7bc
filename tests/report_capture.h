// Collects what IMPError reports while in scope, from any thread, and puts
// the handler that was installed before back at the end of the scope.
#pragma once

#include <services/utilhub.h>

#include <mutex>
#include <string>
#include <utility>
#include <vector>

struct CapturedReport {
    int code;
    int severity;
    std::string message;  // "" for a null message
};

class ReportCapture {
  public:
    ReportCapture() : oPrevious(IMPSetErrorHandler(&Record)) { Active() = this; }
    ~ReportCapture() {
        IMPSetErrorHandler(oPrevious);
        Active() = nullptr;
    }
    ReportCapture(const ReportCapture&) = delete;
    ReportCapture& operator=(const ReportCapture&) = delete;

    // The handler this capture installed, and the one it replaced.
    static IMPErrorHandler Handler() { return &Record; }
    IMPErrorHandler Previous() const { return oPrevious; }

    // Read these once the threads that report are done.
    const std::vector<CapturedReport>& Reports() const { return oReports; }
    // Each report as "code/severity message".
    std::vector<std::string> Texts() const {
        std::vector<std::string> texts;
        for (const CapturedReport& report : oReports) {
            texts.push_back(std::to_string(report.code) + "/" + std::to_string(report.severity) +
                            " " + report.message);
        }
        return texts;
    }
    std::vector<CapturedReport> Take() {
        std::lock_guard<std::mutex> guard(oLock);
        return std::exchange(oReports, {});
    }
    void Clear() { Take(); }

  private:
    static ReportCapture*& Active() {
        static ReportCapture* active = nullptr;
        return active;
    }
    static void Record(int code, int severity, const char* message) {
        ReportCapture* capture = Active();
        if (capture != nullptr) {
            std::lock_guard<std::mutex> guard(capture->oLock);
            capture->oReports.push_back({code, severity, message != nullptr ? message : ""});
        }
    }

    IMPErrorHandler oPrevious;
    std::mutex oLock;
    std::vector<CapturedReport> oReports;
};
