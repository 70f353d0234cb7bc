#include <dwxcore/dwxstring.h>

#include <services/rtprim.h>

#include <assert.h>
#include <limits.h>
#include <stdio.h>
#include <stdlib.h>
#include <string.h>

const char DWXString::chNil = '\0';

namespace {

char* NilBuffer() {
    // chNil is never written: every write path either takes a heap block first
    // or is skipped while the buffer is chNil.
    return const_cast<char*>(&DWXString::chNil);
}

int TextLength(const char* text) {
    return text ? static_cast<int>(strlen(text)) : 0;
}

const char* OrEmpty(const char* text) {
    return text ? text : "";
}

}  // namespace

// ---------------------------------------------------------------------------
// Growth

void DWXString::Alloc(int n) {
    if (n <= 0) {
        pchData = NilBuffer();
        nLength = 0;
        nCapacity = 0;
        return;
    }
    pchData = static_cast<char*>(HMalloc(static_cast<size_t>(n) + 1));
    pchData[n] = '\0';
    nLength = n;
    nCapacity = n + 1;
}

char* DWXString::Grow(int n, int keep) {
    if (n < nCapacity || n == 0) {
        return nullptr;
    }
    // Twice the need; a capacity beyond INT_MAX is recorded as INT_MAX, which
    // only understates the block.
    char* block = static_cast<char*>(HMalloc(2 * static_cast<size_t>(n)));
    if (keep) {
        memcpy(block, pchData, static_cast<size_t>(nLength) + 1);
    } else {
        block[0] = '\0';
        nLength = 0;
    }
    char* old = nCapacity ? pchData : nullptr;
    pchData = block;
    nCapacity = n > INT_MAX / 2 ? INT_MAX : 2 * n;
    return old;
}

void DWXString::Ensure(int n, int keep) {
    free(Grow(n, keep));
}

void DWXString::Assign(const char* text, int n) {
    if (n <= 0) {
        if (nCapacity) {
            nLength = 0;
            pchData[0] = '\0';
        }
        return;
    }
    // The old block stays alive until the copy is made: `text` may lie in it.
    char* old = Grow(n, 0);
    memmove(pchData, text, static_cast<size_t>(n));
    pchData[n] = '\0';
    nLength = n;
    free(old);
}

void DWXString::Append(const char* text, int n) {
    if (n <= 0) {
        return;
    }
    int total = nLength + n;
    char* old = Grow(total, 1);
    memmove(pchData + nLength, text, static_cast<size_t>(n));
    pchData[total] = '\0';
    nLength = total;
    free(old);
}

void DWXString::AppendChar(char ch) {
    Append(&ch, 1);
}

void DWXString::Add(const char* a, int na, const char* b, int nb) {
    // Used on fresh results only, so neither piece lies in this buffer.
    int total = na + nb;
    if (total <= 0) {
        Assign(nullptr, 0);
        return;
    }
    free(Grow(total, 0));
    if (na > 0) {
        memcpy(pchData, a, static_cast<size_t>(na));
    }
    if (nb > 0) {
        memcpy(pchData + na, b, static_cast<size_t>(nb));
    }
    pchData[total] = '\0';
    nLength = total;
}

// ---------------------------------------------------------------------------
// Construction and assignment

DWXString::DWXString() {
    Alloc(0);
}

DWXString::DWXString(const DWXString& other) {
    Alloc(other.nLength);
    if (nLength) {
        memcpy(pchData, other.pchData, static_cast<size_t>(nLength));
    }
}

DWXString::DWXString(char ch, int count) {
    Alloc(count);
    if (nLength) {
        memset(pchData, ch, static_cast<size_t>(nLength));
    }
}

DWXString::DWXString(const char* text) : DWXString(text, TextLength(text)) {}

DWXString::DWXString(const char* text, int count) {
    Alloc(text ? count : 0);
    if (nLength) {
        memcpy(pchData, text, static_cast<size_t>(nLength));
    }
}

DWXString::~DWXString() {
    if (nCapacity) {
        free(pchData);
    }
}

const DWXString& DWXString::operator=(const DWXString& other) {
    if (&other != this) {
        Assign(other.pchData, other.nLength);
    }
    return *this;
}

const DWXString& DWXString::operator=(const char* text) {
    Assign(text, TextLength(text));
    return *this;
}

const DWXString& DWXString::operator=(char ch) {
    if (nCapacity < 2) {
        if (nCapacity) {
            free(pchData);
        }
        pchData = static_cast<char*>(HMalloc(2));
        nCapacity = 2;
    }
    pchData[0] = ch;
    pchData[1] = '\0';
    nLength = 1;
    return *this;
}

const DWXString& DWXString::operator+=(const DWXString& other) {
    Append(other.pchData, other.nLength);
    return *this;
}

const DWXString& DWXString::operator+=(const char* text) {
    Append(text, TextLength(text));
    return *this;
}

DWXString operator+(const DWXString& a, const DWXString& b) {
    DWXString result;
    result.Add(a.pchData, a.nLength, b.pchData, b.nLength);
    return result;
}

DWXString operator+(const DWXString& a, char b) {
    DWXString result;
    result.Add(a.pchData, a.nLength, &b, 1);
    return result;
}

DWXString operator+(const DWXString& a, const char* b) {
    DWXString result;
    result.Add(a.pchData, a.nLength, b, TextLength(b));
    return result;
}

DWXString operator+(char a, const DWXString& b) {
    DWXString result;
    result.Add(&a, 1, b.pchData, b.nLength);
    return result;
}

DWXString operator+(const char* a, const DWXString& b) {
    DWXString result;
    result.Add(a, TextLength(a), b.pchData, b.nLength);
    return result;
}

// ---------------------------------------------------------------------------
// Access and comparison

char& DWXString::operator[](int index) {
    assert(index >= 0 && index <= nLength);
    if (nCapacity == 0) {
        // The terminator of an empty string is the read-only chNil: a write
        // there, such as e[e.GetLength()] = '\0', goes to a scratch byte of
        // the thread instead, and the string stays empty.
        thread_local char scratch;
        scratch = '\0';
        return scratch;
    }
    return pchData[index];
}

char DWXString::operator[](int index) const {
    assert(index >= 0 && index <= nLength);
    return pchData[index];
}

char DWXString::GetAt(int index) const {
    return index >= 0 && index <= nLength ? pchData[index] : '\0';
}

int DWXString::Compare(const char* text) const {
    // strcmp compares as unsigned char; only the sign is passed on.
    int result = strcmp(pchData, OrEmpty(text));
    return (result > 0) - (result < 0);
}

int DWXString::CompareNoCase(const char* text) const {
    return _stricmp(pchData, OrEmpty(text));
}

int DWXString::Collate(const char* text) const {
    return CompareNoCase(text);
}

// ---------------------------------------------------------------------------
// Searching and substrings

int DWXString::Find(char ch) const {
    const char* found = strchr(pchData, ch);
    return found ? static_cast<int>(found - pchData) : -1;
}

int DWXString::Find(const char* text) const {
    const char* found = strstr(pchData, OrEmpty(text));
    return found ? static_cast<int>(found - pchData) : -1;
}

int DWXString::ReverseFind(char ch) const {
    const char* found = strrchr(pchData, ch);
    return found ? static_cast<int>(found - pchData) : -1;
}

DWXString DWXString::Left(int count) const {
    DWXString result;
    result.Assign(pchData, count < nLength ? count : nLength);
    return result;
}

DWXString DWXString::Right(int count) const {
    DWXString result;
    if (count > nLength) {
        count = nLength;
    }
    if (count > 0) {
        result.Assign(pchData + nLength - count, count);
    }
    return result;
}

DWXString DWXString::Mid(int start, int count) const {
    DWXString result;
    if (start < 0) {
        start = 0;
    }
    if (start > nLength || count < -1) {
        return result;
    }
    if (count == -1 || count > nLength - start) {
        count = nLength - start;
    }
    result.Assign(pchData + start, count);
    return result;
}

// ---------------------------------------------------------------------------
// Editing and conversion

void DWXString::SetAt(int index, char ch) {
    if (index == nLength) {
        Append(&ch, 1);
    } else if (index >= 0 && index < nLength) {
        pchData[index] = ch;
    }
}

void DWXString::SetLength(int newLength) {
    if (newLength < 0) {
        newLength = 0;
    }
    if (newLength == nLength) {
        return;
    }
    if (newLength > nLength) {
        Ensure(newLength, 1);
        memset(pchData + nLength, ' ', static_cast<size_t>(newLength - nLength));
    }
    nLength = newLength;
    pchData[newLength] = '\0';
}

void DWXString::Empty() {
    if (nCapacity) {
        free(pchData);
    }
    Alloc(0);
}

DWXString& DWXString::MakeUpper() {
    if (nLength) {
        UCaseString(pchData);
    }
    return *this;
}

DWXString& DWXString::MakeLower() {
    if (nLength) {
        LCaseString(pchData);
    }
    return *this;
}

int DWXString::ToInt() const {
    return TZN_atoi(pchData);
}

double DWXString::ToDouble() const {
    return ScanDouble(pchData, nLength);
}

// ---------------------------------------------------------------------------
// Formatting

void DWXString::FormatV(const char* format, va_list args) {
    va_list measure;
    va_copy(measure, args);
    int n = vsnprintf(nullptr, 0, OrEmpty(format), measure);
    va_end(measure);
    if (n <= 0) {
        // An empty result, or a format the C runtime rejects.
        Assign(nullptr, 0);
        return;
    }
    if (n >= nCapacity) {
        // Format straight into the new block; the old one stays alive while
        // the arguments may still point into it.
        char* old = Grow(n, 0);
        vsnprintf(pchData, static_cast<size_t>(n) + 1, OrEmpty(format), args);
        nLength = n;
        free(old);
        const int length = static_cast<int>(strlen(pchData));
        if (length < n) {
            // A %c of 0 ended the text early: keep what comes before it, in
            // a block sized for that.
            char* text = pchData;
            pchData = NilBuffer();
            nLength = nCapacity = 0;
            Assign(text, length);
            free(text);
        }
        return;
    }
    // The text fits the current block, but an argument may lie in it, so the
    // text is made elsewhere first.
    char small[256];
    char* scratch = n < static_cast<int>(sizeof small)
                        ? small
                        : static_cast<char*>(HMalloc(static_cast<size_t>(n) + 1));
    vsnprintf(scratch, static_cast<size_t>(n) + 1, OrEmpty(format), args);
    Assign(scratch, static_cast<int>(strlen(scratch)));  // up to a NUL from %c
    if (scratch != small) {
        free(scratch);
    }
}

void DWXString::Format(const char* format, ...) {
    va_list args;
    va_start(args, format);
    FormatV(format, args);
    va_end(args);
}

DWXString DWXFormat(const char* format, ...) {
    DWXString result;
    va_list args;
    va_start(args, format);
    result.FormatV(format, args);
    va_end(args);
    return result;
}
