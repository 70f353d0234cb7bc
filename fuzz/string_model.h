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

struct StringModel {
    static const int kOperations = 12;
    static const int kAppendChar = 2;
    DWXString s;
    std::string model;

    static int Sign(int value) { return (value > 0) - (value < 0); }
    static int IndexOf(const char* base, const char* at) { return at ? int(at - base) : -1; }

    // Up to `steps` operations drawn from the input, each checked.
    void Run(FuzzInput& input, int steps) {
        for (int step = 0; step < steps && !input.Empty(); ++step) {
            Apply(input.Range(0, kOperations - 1), input);
            Check(input);
        }
    }

    void Check(FuzzInput& input) const {
        const int length = static_cast<int>(model.size());
        const char* text = s;
        FUZZ_CHECK(s.GetLength() == length && s.IsEmpty() == (length == 0));
        FUZZ_CHECK(memcmp(text, model.data(), model.size()) == 0 && text[length] == '\0');
        const int index = input.Range(-2, length + 2);
        FUZZ_CHECK(s.GetAt(index) == (index >= 0 && index <= length ? text[index] : '\0'));
        const std::string probe = input.Text(4);
        const char* c = model.c_str();
        const char ch = static_cast<char>(input.Byte());
        const char* const given = probe.empty() && ch & 1 ? nullptr : probe.c_str();
        FUZZ_CHECK(s.Compare(given) == Sign(strcmp(c, probe.c_str())));
        FUZZ_CHECK(s.Find(given) == IndexOf(c, strstr(c, probe.c_str())));
        FUZZ_CHECK(s.Find(ch) == IndexOf(c, strchr(c, ch)));
        FUZZ_CHECK(s.ReverseFind(ch) == IndexOf(c, strrchr(c, ch)));
        FUZZ_CHECK(s.ToInt() == atoi(c));
    }

    void Apply(int operation, FuzzInput& input) {
        const int length = static_cast<int>(model.size());
        const std::string text = operation <= 5 ? input.Text(40) : "";
        const char* const ctext = text.c_str();
        const char ch = static_cast<char>(input.Byte());
        const int count = input.Range(-3, length + 3);
        const char* const given = text.empty() && count & 1 ? nullptr : ctext;  // null reads as ""
        const int start = std::clamp(count, 0, length);
        // Doubling is skipped past 4096 bytes, so that a run stays fast.
        const bool big = length > 4096;
        switch (operation) {
            case 0:  // = and += of text
                ch & 1 ? (s = given) : (s += DWXString(text.data(), int(text.size())));
                ch & 1 ? (model = ctext) : (model += text);
                break;
            case 1:
                s = DWXString(text.data(), std::min(count, int(text.size())));
                model = text.substr(0, size_t(std::max(count, 0)));
                break;
            case kAppendChar:
                s += ch;
                model += ch;
                break;
            case 3:  // every form of +, and += of a C string
                s = (ch + s) + given + (given + DWXString(text.data(), int(text.size()))) + ch;
                s += given;
                model = (ch + model) + ctext + (ctext + text) + ch + ctext;
                break;
            case 4:  // appending to itself: the source lies in the block replaced
                if (!big) {
                    s += s;
                    model += model;
                }
                break;
            case 5: {  // copies, self-assignment, and text from the string's own buffer
                s = DWXString(s);
                s = static_cast<const DWXString&>(s);
                const char* own = s;
                const std::string tail(model.c_str() + start);
                const bool append = (ch & 1) && !big;  // appending from 0 doubles
                append ? (s += own + start) : (s = own + start);
                append ? (model += tail) : (model = tail);
                break;
            }
            case 6:
                s = ch & 1 ? s.Left(count) : s.Right(count);
                model = count <= 0 ? ""
                        : ch & 1   ? model.substr(0, size_t(count))
                                   : model.substr(size_t(std::max(length - count, 0)));
                break;
            case 7: {
                const int from = input.Range(-3, length + 3);
                s = s.Mid(from, count);
                model = from > length || count < -1
                            ? ""
                            : model.substr(size_t(std::max(from, 0)),
                                           count == -1 ? std::string::npos : size_t(count));
                break;
            }
            case 8:  // SetAt, or a write through [] inside the text
                if (count >= 0 && count < length) {
                    ch & 1 ? void(s[count] = ch) : s.SetAt(count, ch);
                    model[size_t(count)] = ch;
                } else {
                    s.SetAt(count, ch);
                    model += count == length ? std::string(1, ch) : "";
                }
                break;
            case 9:
                s.SetLength(count + (ch & 31));
                model.resize(size_t(std::max(count + (ch & 31), 0)), ' ');
                break;
            case 10: {  // arguments in the string's own buffer; a %c of 0 ends the text
                const int number = input.Int();
                const char* own = s;
                s.Format("%s%c%d|%s", own + start, ch, number, big ? "" : own);
                char tail[16];
                snprintf(tail, sizeof tail, "%d|", number);
                model = std::string(model.c_str() + start) + ch + tail + (big ? "" : model.c_str());
                model = model.c_str();
                break;
            }
            default: {  // a run of one character, a single one, or nothing
                const int n = count % 301, form = input.Range(0, 2);
                form == 0 ? void(s = DWXString(ch, n)) : form == 1 ? void(s = ch) : s.Empty();
                model = form == 0 ? std::string(size_t(std::max(n, 0)), ch)
                                  : std::string(size_t(form == 1), ch);
                break;
            }
        }
    }
};
