// Debug tracing. Traces are written only by callers that test moDebugLevel.
#pragma once

#include <services/services_export.h>

#include <stdio.h>

namespace tzn {
namespace tracer {

class DWXSERVICES_API Debugger {
  public:
    // The process's debug level; 0 (the default) means no tracing.
    static int moDebugLevel;

    // Writes "[module:level] source:line: message" to the trace stream.
    static void Debug(const char* message, int level, const char* module, const char* sourceFile,
                      int line);
    // printf-style formatting of a trace message. Borrowed: the text stays
    // valid until the next FormatString call of the same thread.
    static const char* FormatString(const char* format, ...)
#if defined(__GNUC__)
        __attribute__((format(printf, 1, 2)))
#endif
        ;
    // Where traces go; null restores stderr. Returns the previous stream.
    static FILE* SetStream(FILE* stream);
};

}  // namespace tracer
}  // namespace tzn
