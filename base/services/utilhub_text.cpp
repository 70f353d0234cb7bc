// Text helpers: white space, formatted heap strings and the date text.
#include <services/utilhub.h>

#include "internal/utilhub_internal.h"

#include <stdarg.h>
#include <string.h>
#include <time.h>

using dwxservices::internal::IsWhite;

char* LSCGetFirstNonWhiteSpace(char* text) {
    if (!text) {
        return nullptr;
    }
    while (IsWhite(static_cast<unsigned char>(*text))) {
        ++text;
    }
    return text;
}

const char* LSCGetFirstNonWhiteSpace(const char* text) {
    return LSCGetFirstNonWhiteSpace(const_cast<char*>(text));
}

char* LSCEatWSBack(char* text) {
    if (!text) {
        return nullptr;
    }
    size_t length = strlen(text);
    while (length && IsWhite(static_cast<unsigned char>(text[length - 1]))) {
        --length;
    }
    text[length] = '\0';
    return text;
}

std::string::size_type FindFirstNonWhitespace(const std::string& text,
                                              std::string::size_type position) {
    for (; position < text.size(); ++position) {
        if (!IsWhite(static_cast<unsigned char>(text[position]))) {
            return position;
        }
    }
    return std::string::npos;
}

std::string::size_type FindLastNonWhitespace(const std::string& text,
                                             std::string::size_type position) {
    if (text.empty()) {
        return std::string::npos;
    }
    if (position >= text.size()) {
        position = text.size() - 1;
    }
    for (;;) {
        if (!IsWhite(static_cast<unsigned char>(text[position]))) {
            return position;
        }
        if (position == 0) {
            return std::string::npos;
        }
        --position;
    }
}

std::string& TrimWhitespace(std::string& text) {
    std::string::size_type last = FindLastNonWhitespace(text);
    if (last == std::string::npos) {
        text.clear();
        return text;
    }
    text.erase(last + 1);
    text.erase(0, FindFirstNonWhitespace(text));
    return text;
}

std::string dwxservices::internal::FormatV(const char* format, va_list args) {
    std::string text;
    if (!format) {
        return text;
    }
    va_list measure;
    va_copy(measure, args);
    int length = vsnprintf(nullptr, 0, format, measure);
    va_end(measure);
    if (length > 0) {
        text.resize(static_cast<size_t>(length));
        vsnprintf(&text[0], static_cast<size_t>(length) + 1, format, args);
    }
    return text;
}

char* HSPrintf(const char* format, ...) {
    va_list args;
    va_start(args, format);
    std::string text = dwxservices::internal::FormatV(format, args);
    va_end(args);
    char* copy = static_cast<char*>(HMalloc(text.size() + 1));
    memcpy(copy, text.c_str(), text.size() + 1);
    return copy;
}

const char* IMPTime(const void* unused, int kind) {
    (void)unused;
    thread_local char text[64];
    time_t now = time(nullptr);
    struct tm local;
#if defined(_WIN32)
    localtime_s(&local, &now);
#else
    localtime_r(&now, &local);
#endif
    if (kind == 10) {
        snprintf(text, sizeof text, "%d-%d-%d", local.tm_mday, local.tm_mon + 1,
                 local.tm_year + 1900);
    } else {
        snprintf(text, sizeof text, "%d-%d-%d %02d:%02d:%02d", local.tm_mday, local.tm_mon + 1,
                 local.tm_year + 1900, local.tm_hour, local.tm_min, local.tm_sec);
    }
    return text;
}
