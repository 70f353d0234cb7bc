// The library's counted string: a heap buffer with a stored length and
// capacity, copied by value. All empty strings share the read-only chNil and
// own no heap block.
#pragma once

#include <dwxcore/dwxcore_export.h>

#include <stdarg.h>

#if defined(__GNUC__)
#define DWXSTRING_PRINTF(format_index, first_arg) \
    __attribute__((format(printf, format_index, first_arg)))
#else
#define DWXSTRING_PRINTF(format_index, first_arg)
#endif

// A string of bytes. The stored length decides what is copied, so a string may
// hold embedded NUL characters; comparisons, searches, case changes and ToInt
// treat the buffer as a C string and stop at the first NUL.
//
// Growth: whenever n characters must be held and n is not below the capacity,
// a new block of 2 * n bytes replaces the old one, so repeated appends run in
// amortised linear time. Constructors take exactly length + 1 bytes. Shrinking
// never returns memory.
//
// Null C-string arguments are taken as the empty text throughout.
class DWXCORE_API DWXString {
  public:
    // The buffer of every empty string without a heap block. Never written.
    static const char chNil;

    DWXString();
    DWXString(const DWXString& other);
    // `count` copies of `ch`; empty for a count of 0 or less.
    DWXString(char ch, int count);
    DWXString(const char* text);
    // The first `count` bytes at `text`, NULs included; the caller guarantees
    // that they are readable. Empty for a count of 0 or less.
    DWXString(const char* text, int count);
    ~DWXString();

    const DWXString& operator=(const DWXString& other);
    const DWXString& operator=(const char* text);
    const DWXString& operator=(char ch);

    // Appending; a string may be appended to itself or to a part of itself.
    const DWXString& operator+=(const DWXString& other);
    const DWXString& operator+=(const char* text);
    // Inline for the common case of a block with room for the character and
    // its NUL; otherwise the block grows as for any other append. The length
    // is stored last, after the character stores that might alias it, so the
    // compiler can keep it in a register across a loop of appends.
    const DWXString& operator+=(char ch) {
        int length = nLength;
        char* data = pchData;
        if (length + 1 < nCapacity) {
            data[length] = ch;
            data[length + 1] = '\0';
            nLength = length + 1;
        } else {
            AppendChar(ch);
        }
        return *this;
    }

    friend DWXCORE_API DWXString operator+(const DWXString& a, const DWXString& b);
    friend DWXCORE_API DWXString operator+(const DWXString& a, char b);
    friend DWXCORE_API DWXString operator+(const DWXString& a, const char* b);
    friend DWXCORE_API DWXString operator+(char a, const DWXString& b);
    friend DWXCORE_API DWXString operator+(const char* a, const DWXString& b);

    int GetLength() const { return nLength; }
    int IsEmpty() const { return nLength == 0; }
    int operator!() const { return nLength == 0; }

    // The buffer; borrowed, valid until the string is next changed or
    // destroyed. For an empty string this is chNil, which must not be written.
    operator const char*() const { return pchData; }
    char* GetBufferRef() { return pchData; }

    // The index must lie within 0 to the length (checked with assert). The
    // terminator of an empty string may be written: the string stays empty.
    char& operator[](int index);
    char operator[](int index) const;
    // The character at `index`; 0 outside 0 to the length.
    char GetAt(int index) const;

    // -1, 0 or 1 as the string sorts before, with or after `text`, comparing
    // unsigned bytes.
    int Compare(const char* text) const;
    // Negative, zero or positive, ignoring ASCII case.
    int CompareNoCase(const char* text) const;
    // The same as CompareNoCase.
    int Collate(const char* text) const;

    // Indexes of the first or last occurrence, or -1. An empty text is found at 0.
    int Find(char ch) const;
    int Find(const char* text) const;
    int ReverseFind(char ch) const;

    // Substrings. A negative count gives the empty string; Mid starts at 0 for
    // a negative start, takes the rest for a count of -1 and gives the empty
    // string for a count below -1.
    DWXString Left(int count) const;
    DWXString Right(int count) const;
    DWXString Mid(int start, int count = -1) const;

    // At index == length, appends `ch`; inside the string, overwrites; any
    // other index changes nothing.
    void SetAt(int index, char ch);
    // Truncates (keeping the block) or pads with blanks. Below 0 counts as 0.
    void SetLength(int newLength);
    // Frees the block and returns to chNil.
    void Empty();
    DWXString& MakeUpper();
    DWXString& MakeLower();

    int ToInt() const;
    double ToDouble() const;

    // Replaces the content with the printf-formatted text, of any length, up
    // to its first NUL (a %c of 0 ends it). Arguments may point into this
    // string's own buffer. Formatting is printf's and follows the host's
    // locale: under a locale with a decimal comma, %f writes a comma.
    void Format(const char* format, ...) DWXSTRING_PRINTF(2, 3);

    friend DWXCORE_API DWXString DWXFormat(const char* format, ...) DWXSTRING_PRINTF(1, 2);

  private:
    void Alloc(int n);
    void Assign(const char* text, int n);
    void Append(const char* text, int n);
    // The growing path of += ch; out of line, and `ch` by value so that the
    // inline part keeps it in a register.
    void AppendChar(char ch);
    void Add(const char* a, int na, const char* b, int nb);
    void Ensure(int n, int keep);
    // Takes a new block when n characters do not fit. Returns the old block,
    // which the caller frees once it has copied what it needs from it (null
    // when nothing is to be freed).
    char* Grow(int n, int keep);
    void FormatV(const char* format, va_list args);

    char* pchData;
    int nLength;
    int nCapacity;
};

DWXCORE_API DWXString operator+(const DWXString& a, const DWXString& b);
DWXCORE_API DWXString operator+(const DWXString& a, char b);
DWXCORE_API DWXString operator+(const DWXString& a, const char* b);
DWXCORE_API DWXString operator+(char a, const DWXString& b);
DWXCORE_API DWXString operator+(const char* a, const DWXString& b);

// A new string holding the printf-formatted text, of any length, up to its
// first NUL. Like Format, it follows the host's locale (%f may write a comma).
DWXCORE_API DWXString DWXFormat(const char* format, ...) DWXSTRING_PRINTF(1, 2);
