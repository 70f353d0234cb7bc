// Which string values reading expands on purpose: values beginning with '@'
// (translation prefixes), translation calls _(...) and the MkTokenString list
// form, white space before them allowed. Every other value reads back as it
// was written.
#pragma once

#include <services/utilhub.h>

#include <string>

inline bool ExpandsOnReading(const std::string& value) {
    const std::string::size_type first = FindFirstNonWhitespace(value, 0);
    const std::string rest = first == std::string::npos ? "" : value.substr(first);
    return value[0] == '@' || rest.rfind("_(", 0) == 0 || rest.rfind("MkTokenString", 0) == 0;
}
