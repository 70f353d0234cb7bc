#include <services/tracer.h>

#include "internal/utilhub_internal.h"

#include <stdarg.h>

#include <string>

namespace tzn {
namespace tracer {

int Debugger::moDebugLevel = 0;

namespace {
FILE* traceStream = nullptr;  // null: stderr
}

void Debugger::Debug(const char* message, int level, const char* module, const char* sourceFile,
                     int line) {
    FILE* out = traceStream ? traceStream : stderr;
    fprintf(out, "[%s:%d] %s:%d: %s", module ? module : "", level, sourceFile ? sourceFile : "",
            line, message ? message : "");
    fflush(out);
}

const char* Debugger::FormatString(const char* format, ...) {
    thread_local std::string text;
    va_list args;
    va_start(args, format);
    text = dwxservices::internal::FormatV(format, args);
    va_end(args);
    return text.c_str();
}

FILE* Debugger::SetStream(FILE* stream) {
    FILE* previous = traceStream ? traceStream : stderr;
    traceStream = stream;
    return previous;
}

}  // namespace tracer
}  // namespace tzn
