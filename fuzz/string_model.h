// A DWXString run side by side with a std::string model, for the fuzz target
// and the unit test. Apply takes one operation, drawn with its arguments from
// the input, on both; Check compares content and length (embedded NULs
// included), the terminator, and the C-string queries, which stop at the
// first NUL.
#pragma once

#include <dwxcore/dwxstring.h>

#include "fuzz_input.h"

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <algorithm>
#include <string>

class StringModel {
  public:
    static const int kOperations = 18;
    static const int kAppendChar = 3;

    void Apply(int operation, FuzzInput& input);
    void Check(FuzzInput& input) const;

    // Up to `steps` operations drawn from the input, each checked.
    void Run(FuzzInput& input, int steps) {
        for (int step = 0; step < steps && !input.Empty(); ++step) {
            Apply(input.Range(0, kOperations - 1), input);
            Check(input);
        }
    }

  private:
    static int Sign(int value) { return (value > 0) - (value < 0); }
    static int Lower(char c) { return c >= 'A' && c <= 'Z' ? c | 0x20 : static_cast<uint8_t>(c); }
    static int IndexOf(const char* base, const char* found) {
        return found ? static_cast<int>(found - base) : -1;
    }
    static int CompareNoCase(const char* a, const char* b) {
        for (;; ++a, ++b) {
            if (Lower(*a) != Lower(*b) || *a == '\0') {
                return Sign(Lower(*a) - Lower(*b));
            }
        }
    }

    DWXString s;
    std::string model;
};

inline void StringModel::Check(FuzzInput& input) const {
    const int length = static_cast<int>(model.size());
    const char* text = s;
    FUZZ_CHECK(s.GetLength() == length && s.IsEmpty() == (length == 0));
    FUZZ_CHECK(memcmp(text, model.data(), model.size()) == 0 && text[length] == '\0');

    const int index = input.Range(-2, length + 2);
    FUZZ_CHECK(s.GetAt(index) == (index >= 0 && index <= length ? model.c_str()[index] : '\0'));
    const std::string probe = input.Text(4);
    const char* c = model.c_str();
    FUZZ_CHECK(s.Compare(probe.c_str()) == Sign(strcmp(c, probe.c_str())));
    FUZZ_CHECK(Sign(s.CompareNoCase(probe.c_str())) == CompareNoCase(c, probe.c_str()));
    FUZZ_CHECK(s.Find(probe.c_str()) == IndexOf(c, strstr(c, probe.c_str())));
    const char ch = static_cast<char>(input.Byte());
    FUZZ_CHECK(s.Find(ch) == IndexOf(c, strchr(c, ch)));
    FUZZ_CHECK(s.ReverseFind(ch) == IndexOf(c, strrchr(c, ch)));
    FUZZ_CHECK(s.ToInt() == atoi(c));
}

inline void StringModel::Apply(int operation, FuzzInput& input) {
    const int length = static_cast<int>(model.size());
    // Operations that double the string are skipped past 4096 bytes, so that a
    // run stays fast; growth itself is covered long before that.
    const bool big = length > 4096;
    const std::string text = operation <= 6 ? input.Text(40) : "";
    const char ch = static_cast<char>(input.Byte());
    const int count = input.Range(-3, length + 3);
    switch (operation) {
        case 0:
            s = text.c_str();
            model = text.c_str();
            break;
        case 1: {
            const int n = std::min(count, static_cast<int>(text.size()));
            s = DWXString(text.data(), n);
            model = text.substr(0, static_cast<size_t>(std::max(n, 0)));
            break;
        }
        case 2:
            s += text.c_str();
            model += text.c_str();
            break;
        case kAppendChar:
            s += ch;
            model += ch;
            break;
        case 4:
            s += DWXString(text.data(), static_cast<int>(text.size()));
            model += text;
            break;
        case 5:
            if (!big) {
                s += s;
                model += model;
            }
            break;
        case 6: {
            const DWXString other(text.data(), static_cast<int>(text.size()));
            switch (count & 3) {
                case 0:
                    s = s + other + ch;
                    model = model + text + ch;
                    break;
                case 1:
                    s = ch + s + text.c_str();
                    model = ch + model + text.c_str();
                    break;
                default:
                    s = text.c_str() + s;
                    model = text.c_str() + model;
            }
            break;
        }
        case 7:
            s = s.Left(count);
            model = model.substr(0, static_cast<size_t>(count < 0 ? 0 : count));
            break;
        case 8:
            s = s.Right(count);
            model =
                count <= 0 ? "" : model.substr(static_cast<size_t>(std::max(length - count, 0)));
            break;
        case 9: {
            const int start = input.Range(-3, length + 3);
            s = s.Mid(start, count);
            if (start > length || count < -1) {
                model.clear();
            } else {
                model = model.substr(static_cast<size_t>(std::max(start, 0)),
                                     count == -1 ? std::string::npos : static_cast<size_t>(count));
            }
            break;
        }
        case 10:
            if (count >= 0 && count < length && input.Flag()) {
                s[count] = ch;
            } else {
                s.SetAt(count, ch);
            }
            if (count == length) {
                model += ch;
            } else if (count >= 0 && count < length) {
                model[static_cast<size_t>(count)] = ch;
            }
            break;
        case 11: {
            const int newLength = count + input.Range(0, 40);
            s.SetLength(newLength);
            model.resize(static_cast<size_t>(std::max(newLength, 0)), ' ');
            break;
        }
        case 12:
            s.Empty();
            model.clear();
            break;
        case 13:
            ch & 1 ? s.MakeUpper() : s.MakeLower();
            for (size_t i = 0; i < model.size() && model[i] != '\0'; ++i) {
                const char c = model[i];
                if (c >= (ch & 1 ? 'a' : 'A') && c <= (ch & 1 ? 'z' : 'Z')) {
                    model[i] = static_cast<char>(c ^ 0x20);
                }
            }
            break;
        case 14: {
            // Arguments inside the string's own buffer; a %c of 0 ends the text.
            if (big) {
                break;
            }
            const int number = input.Int();
            const char* own = s;
            const int start = std::max(0, std::min(count, length));
            s.Format("%s%c%d|%s", own + start, ch, number, own);
            char digits[16];
            snprintf(digits, sizeof digits, "%d", number);
            const std::string self(model.c_str());
            model = std::string(model.c_str() + start) + ch + digits + "|" + self;
            model = model.c_str();
            break;
        }
        case 15:
            s = DWXString(ch, count % 301);
            model.assign(static_cast<size_t>(std::max(count % 301, 0)), ch);
            break;
        case 16: {
            // Copies, self-assignment, and text taken from the string's own buffer.
            const DWXString copy(s);
            DWXString assigned("x");
            assigned = copy;
            const DWXString& same = assigned;
            assigned = same;
            s = assigned;
            const int start = std::max(0, std::min(count, length));
            const std::string tail(model.c_str() + start);
            if (ch & 1) {
                s += static_cast<const char*>(s) + start;
                model += tail;
            } else {
                s = static_cast<const char*>(s) + start;
                model = tail;
            }
            break;
        }
        default:
            s = ch;
            model.assign(1, ch);
            break;
    }
}
