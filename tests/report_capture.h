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

class ReportCapture {  // not copyable: it holds a mutex
  public:
    ReportCapture() : oPrevious(IMPSetErrorHandler(&Record)) { pActive = this; }
    ~ReportCapture() {
        IMPSetErrorHandler(oPrevious);
        pActive = nullptr;
    }
    // The handler this capture installed, and the one it replaced.
    static IMPErrorHandler Handler() { return &Record; }
    IMPErrorHandler Previous() const { return oPrevious; }
    // Read these once the threads that report are done.
    const std::vector<CapturedReport>& Reports() const { return oReports; }
    std::vector<std::string> Texts() const {  // each as "code/severity message"
        std::vector<std::string> texts;
        for (const CapturedReport& r : oReports) {
            texts.push_back(std::to_string(r.code) + "/" + std::to_string(r.severity) + " " +
                            r.message);
        }
        return texts;
    }
    std::vector<CapturedReport> Take() {
        std::lock_guard<std::mutex> guard(oLock);
        return std::exchange(oReports, {});
    }
    void Clear() { Take(); }

  private:
    static void Record(int code, int severity, const char* message) {
        if (ReportCapture* capture = pActive) {
            std::lock_guard<std::mutex> guard(capture->oLock);
            capture->oReports.push_back({code, severity, message ? message : ""});
        }
    }
    static inline ReportCapture* pActive = nullptr;
    IMPErrorHandler oPrevious;
    std::mutex oLock;
    std::vector<CapturedReport> oReports;
};
