// Random sequences of DWXString operations checked against a std::string
// model after every step: content and length (embedded NULs included), the
// terminator, and the C-string queries, which stop at the first NUL.
#include <dwxcore/dwxstring.h>

#include "fuzz_input.h"

#include <stdio.h>
#include <stdlib.h>
#include <string.h>

#include <string>

namespace {

int Sign(int value) {
    return (value > 0) - (value < 0);
}

int LowerAscii(unsigned char c) {
    return c >= 'A' && c <= 'Z' ? c | 0x20 : c;
}

int CompareNoCaseModel(const char* a, const char* b) {
    for (;; ++a, ++b) {
        int x = LowerAscii(static_cast<unsigned char>(*a));
        int y = LowerAscii(static_cast<unsigned char>(*b));
        if (x != y || x == 0) {
            return Sign(x - y);
        }
    }
}

int IndexOf(const char* base, const char* found) {
    return found ? static_cast<int>(found - base) : -1;
}

void Check(const DWXString& s, const std::string& model, FuzzInput& input) {
    const int length = static_cast<int>(model.size());
    const char* text = s;
    FUZZ_CHECK(s.GetLength() == length);
    FUZZ_CHECK(s.IsEmpty() == (length == 0));
    FUZZ_CHECK(memcmp(text, model.data(), model.size()) == 0);
    FUZZ_CHECK(text[length] == '\0');

    const int index = input.Range(-2, length + 2);
    FUZZ_CHECK(s.GetAt(index) == (index >= 0 && index <= length ? model.c_str()[index] : '\0'));

    const std::string probe = input.Text(4);
    const char* c = model.c_str();
    FUZZ_CHECK(s.Compare(probe.c_str()) == Sign(strcmp(c, probe.c_str())));
    FUZZ_CHECK(Sign(s.CompareNoCase(probe.c_str())) == CompareNoCaseModel(c, probe.c_str()));
    FUZZ_CHECK(s.Find(probe.c_str()) == IndexOf(c, strstr(c, probe.c_str())));
    const char ch = static_cast<char>(input.Byte());
    FUZZ_CHECK(s.Find(ch) == IndexOf(c, strchr(c, ch)));
    FUZZ_CHECK(s.ReverseFind(ch) == IndexOf(c, strrchr(c, ch)));
    FUZZ_CHECK(s.ToInt() == atoi(c));
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);
    DWXString s;
    std::string model;
    for (int step = 0; step < 64 && !input.Empty(); ++step) {
        const int length = static_cast<int>(model.size());
        // Operations that double the string are skipped past 4096 bytes, so
        // that a run stays fast; growth itself is covered long before that.
        const bool big = length > 4096;
        switch (input.Range(0, 17)) {
            case 0: {
                const std::string text = input.Text(40);
                s = text.c_str();
                model = text.c_str();
                break;
            }
            case 1: {
                const std::string text = input.Text(40);
                const int count = input.Range(-2, static_cast<int>(text.size()));
                s = DWXString(text.data(), count);
                model = count > 0 ? text.substr(0, static_cast<size_t>(count)) : "";
                break;
            }
            case 2: {
                const std::string text = input.Text(40);
                s += text.c_str();
                model += text.c_str();
                break;
            }
            case 3: {
                const char ch = static_cast<char>(input.Byte());
                s += ch;
                model += ch;
                break;
            }
            case 4: {
                const std::string text = input.Text(40);
                s += DWXString(text.data(), static_cast<int>(text.size()));
                model += text;
                break;
            }
            case 5:
                if (!big) {
                    s += s;
                    model += model;
                }
                break;
            case 6: {
                const std::string text = input.Text(8);
                const DWXString other(text.data(), static_cast<int>(text.size()));
                const char ch = static_cast<char>(input.Byte());
                switch (input.Range(0, 5)) {
                    case 0:
                        s = s + other;
                        model = model + text;
                        break;
                    case 1:
                        s = s + ch;
                        model = model + ch;
                        break;
                    case 2:
                        s = ch + s;
                        model = ch + model;
                        break;
                    case 3:
                        s = text.c_str() + s;
                        model = text.c_str() + model;
                        break;
                    case 4:
                        s = s + text.c_str();
                        model = model + text.c_str();
                        break;
                    default:
                        s = s + s;
                        model = model + model;
                        break;
                }
                break;
            }
            case 7: {
                const int count = input.Range(-3, length + 3);
                s = s.Left(count);
                model = count <= 0 ? "" : model.substr(0, static_cast<size_t>(count));
                break;
            }
            case 8: {
                const int count = input.Range(-3, length + 3);
                s = s.Right(count);
                model = count <= 0        ? ""
                        : count >= length ? model
                                          : model.substr(static_cast<size_t>(length - count));
                break;
            }
            case 9: {
                int start = input.Range(-3, length + 3);
                const int count = input.Range(-3, length + 3);
                s = s.Mid(start, count);
                if (start < 0) {
                    start = 0;
                }
                if (start > length || count < -1) {
                    model.clear();
                } else {
                    model =
                        model.substr(static_cast<size_t>(start),
                                     count == -1 ? std::string::npos : static_cast<size_t>(count));
                }
                break;
            }
            case 10: {
                const int index = input.Range(-2, length + 2);
                const char ch = static_cast<char>(input.Byte());
                s.SetAt(index, ch);
                if (index == length) {
                    model += ch;
                } else if (index >= 0 && index < length) {
                    model[static_cast<size_t>(index)] = ch;
                }
                break;
            }
            case 11: {
                const int newLength = input.Range(-2, length + 40);
                s.SetLength(newLength);
                model.resize(newLength < 0 ? 0 : static_cast<size_t>(newLength), ' ');
                break;
            }
            case 12:
                s.Empty();
                model.clear();
                break;
            case 13: {
                const bool upper = input.Flag();
                upper ? s.MakeUpper() : s.MakeLower();
                for (size_t i = 0; i < model.size() && model[i] != '\0'; ++i) {
                    char& c = model[i];
                    if (upper && c >= 'a' && c <= 'z') {
                        c = static_cast<char>(c - 'a' + 'A');
                    } else if (!upper && c >= 'A' && c <= 'Z') {
                        c = static_cast<char>(c - 'A' + 'a');
                    }
                }
                break;
            }
            case 14: {
                // Formatting with arguments inside the string's own buffer.
                if (big) {
                    break;
                }
                const int number = input.Int();
                const std::string self(model.c_str());
                s.Format("%s|%d|%s", static_cast<const char*>(s), number,
                         static_cast<const char*>(s));
                char digits[16];
                snprintf(digits, sizeof digits, "%d", number);
                model = self + "|" + digits + "|" + self;
                break;
            }
            case 15: {
                const char ch = static_cast<char>(input.Byte());
                const int count = input.Range(-2, 300);
                s = DWXString(ch, count);
                model = count > 0 ? std::string(static_cast<size_t>(count), ch) : "";
                break;
            }
            case 16: {
                const DWXString copy(s);
                DWXString assigned("x");
                assigned = copy;
                const DWXString& same = s;
                s = same;
                s = assigned;
                break;
            }
            default: {
                const char ch = static_cast<char>(input.Byte());
                s = ch;
                model.assign(1, ch);
                break;
            }
        }
        Check(s, model, input);
    }
    return 0;
}
