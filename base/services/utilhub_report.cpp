// Reporting and lifetime: tzn::Exception, IMPError with its handler hook,
// exit callbacks and the preference base classes.
#include <services/utilhub.h>

#include <stdlib.h>

#include <atomic>
#include <mutex>
#include <string>

namespace tzn {

Exception::Exception(int code, int severity, const char* message)
    : nCode(code), nSeverity(severity), oMessage(message ? message : "") {}

const char* Exception::what() const noexcept {
    return oMessage.c_str();
}

}  // namespace tzn

namespace {

// One line on stderr: line ends inside the message become blanks and
// trailing white space is dropped.
void WriteReportLine(int code, int severity, const char* message) {
    std::string line(message ? message : "");
    for (char& c : line) {
        if (c == '\n' || c == '\r') {
            c = ' ';
        }
    }
    TrimWhitespace(line);
    fprintf(stderr, "dwxcore: error %d (severity %d): %s\n", code, severity, line.c_str());
    fflush(stderr);
}

std::atomic<IMPErrorHandler> errorHandler{nullptr};

// Exit callbacks, last registered at the end. Plain constant-initialised
// data: usable from any static constructor or destructor, never torn down
// before the callbacks have run.
struct ExitEntry {
    void (*callback)();
    const char* sourceFile;
    int line;
};
std::mutex exitLock;
ExitEntry* exitEntries = nullptr;
size_t exitCount = 0;
size_t exitCapacity = 0;
bool exitArmed = false;  // RunExitCallbacks is registered with atexit

// Runs the callbacks last-registered first. A callback may register another;
// it runs in turn, since each one is taken off the list before it is called.
void RunExitCallbacks() {
    for (;;) {
        ExitEntry entry;
        {
            std::lock_guard<std::mutex> guard(exitLock);
            if (exitCount == 0) {
                free(exitEntries);
                exitEntries = nullptr;
                exitCapacity = 0;
                exitArmed = false;
                return;
            }
            entry = exitEntries[--exitCount];
        }
        try {
            entry.callback();
        } catch (...) {
            fprintf(stderr, "dwxcore: exit callback registered at %s:%d threw an exception\n",
                    entry.sourceFile ? entry.sourceFile : "?", entry.line);
        }
    }
}

}  // namespace

IMPErrorHandler IMPSetErrorHandler(IMPErrorHandler handler) {
    IMPErrorHandler previous = errorHandler.exchange(handler, std::memory_order_acq_rel);
    return previous ? previous : WriteReportLine;
}

void IMPError(int code, int severity, const char* message) {
    if (!message) {
        message = "";
    }
    IMPErrorHandler handler = errorHandler.load(std::memory_order_acquire);
    (handler ? handler : WriteReportLine)(code, severity, message);
    if (severity == 1) {
        throw tzn::Exception(code, severity, message);
    }
}

void _IMPAtExit(void (*callback)(), const char* sourceFile, int line) {
    if (!callback) {
        return;
    }
    bool arm = false;
    {
        std::lock_guard<std::mutex> guard(exitLock);
        if (exitCount == exitCapacity) {
            exitCapacity = exitCapacity ? exitCapacity * 2 : 8;
            exitEntries =
                static_cast<ExitEntry*>(HRealloc(exitEntries, exitCapacity * sizeof(ExitEntry)));
        }
        exitEntries[exitCount++] = ExitEntry{callback, sourceFile, line};
        arm = !exitArmed;
        exitArmed = true;
    }
    if (arm && std::atexit(RunExitCallbacks) != 0) {
        fprintf(stderr, "dwxcore: cannot register exit callbacks (%s:%d)\n",
                sourceFile ? sourceFile : "?", line);
    }
}

PreferenceFormatIF::PreferenceFormatIF() = default;
PreferenceFormatIF::~PreferenceFormatIF() = default;
PreferenceModel::~PreferenceModel() = default;
