// Which string values reading expands on purpose: values beginning with '@'
// (translation prefixes), translation calls _(...) and the MkTokenString list
// form, white space before them allowed. Every other value reads back as it
// was written.
#pragma once

#include <services/utilhub.h>

#include <string>

inline bool ExpandsOnReading(const std::string& value) {
    if (!value.empty() && value[0] == '@') {
        return true;
    }
    std::string::size_type first = FindFirstNonWhitespace(value, 0);
    if (first == std::string::npos) {
        return false;
    }
    return value.compare(first, 2, "_(") == 0 || value.compare(first, 13, "MkTokenString") == 0;
}
