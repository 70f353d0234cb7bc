// Utility layer: string lists, tokenizing, white space, files and paths, error
// reporting, exit hooks and the preference-format base classes.
//
// A string list is a null-terminated array of heap C strings; the array and
// every entry come from malloc, and DestroyStringList releases both. Nothing
// past the terminator is ever read, so hosts may build, cut and edit lists
// themselves.
#pragma once

#include <services/rtprim.h>
#include <services/services_export.h>

#include <stdio.h>

#include <exception>
#include <string>

// ---------------------------------------------------------------------------
// String lists

// The words of `text` split at white space (space, tab, CR, LF, VT, FF). A
// double quote toggles a quoted run in which white space does not split; the
// quote marks stay in the token. Never null; a null or blank text gives an
// empty list. Caller frees with DestroyStringList.
DWXSERVICES_API char** Tokenize(const char* text);
// `text` split at any character of `delimiters`; empty pieces are dropped and
// white space inside pieces is kept. Never null. Caller frees with DestroyStringList.
DWXSERVICES_API char** TokenizeDelim(const char* text, const char* delimiters);

// The number of entries before the terminator; 0 for a null list.
DWXSERVICES_API int CountStringList(char* const* list);
// Frees every entry and the array; a null list is ignored.
DWXSERVICES_API void DestroyStringList(char** list);
// A deep copy; null for a null list. Caller frees with DestroyStringList.
DWXSERVICES_API char** DuplicateStringList(char* const* list);
// Appends a copy of `text` (null is taken as "") and returns the list, which
// may have moved; a null list starts a new one. O(n): the end is found anew on
// every call, so n appends one at a time cost O(n^2); build long lists in one call.
DWXSERVICES_API char** AddStringToList(char** list, const char* text);
// Appends copies of every entry of `other` and returns the list, which may have
// moved; `other` may be the list itself. O(n + m), one reallocation.
DWXSERVICES_API char** AddStringList(char** list, char* const* other);

// One entry per line: split at LF, a CR ending a line is dropped, a UTF-8
// byte order mark at the start is dropped. A final line end does not make an
// extra empty entry. Never null for a non-null buffer (null gives null).
DWXSERVICES_API char** BufferToStringList(const char* buffer);
// The same for the whole content of the file at `path`; null when it cannot be read.
DWXSERVICES_API char** TextFileToStringList(const char* path);
// The entries joined into one heap buffer, each followed by LF. Caller frees with free().
DWXSERVICES_API char* StringListToBuffer(char* const* list);

// The lines of a text file or buffer, one at a time, split by the rules of
// TextFileToStringList and BufferToStringList but without a heap copy of each
// line: a file is read in blocks into one buffer that the reader owns and
// reuses, so memory stays small whatever the file's size.
class DWXSERVICES_API TextLineReader {
  public:
    TextLineReader();
    ~TextLineReader();
    TextLineReader(const TextLineReader&) = delete;
    TextLineReader& operator=(const TextLineReader&) = delete;

    // Starts on the file at `path`. 0, and no lines, when it is neither a
    // regular file that can be opened for reading nor the null device (which
    // has no lines). The file stays open until the reader is destroyed or
    // opened again.
    int OpenFile(const char* path);
    // Starts on a NUL-terminated buffer (null has no lines). The buffer is not
    // copied: it must stay unchanged while the reader walks it.
    void OpenBuffer(const char* buffer);
    // The next line without its line end, NUL-terminated, and its length in
    // `length` (may be null); null after the last line. A line ends at its
    // first NUL byte. The text is the reader's: the caller may change it, its
    // terminator included, and it is valid until the next call.
    char* Next(size_t* length);
    // Non-zero when reading the file failed; the lines handed out before that
    // are the complete lines before the failure (a line the failure cut short
    // is not handed out).
    int Failed() const { return bFailed ? 1 : 0; }
    // The system's error number of that failure (EIO when the system gave
    // none); 0 while reading has not failed.
    int ErrorNumber() const { return nError; }

  private:
    void Close();
    bool Fill();
    void Reserve(size_t size);
    // The next line of a walked buffer or of the file, copied into or left in
    // pcBuffer, its length in `size` without a terminator; null after the last.
    char* NextFromBuffer(size_t* size);
    char* NextFromFile(size_t* size);

    FILE* poFile;
    char* pcBuffer;  // nCapacity bytes and room for a terminator
    size_t nCapacity;
    size_t nBegin;       // first byte of the next line
    size_t nScanned;     // bytes before this hold no line end after nBegin
    size_t nFilled;      // bytes read into the buffer
    const char* pcText;  // a walked buffer: its next line and its end
    const char* pcTextEnd;
    bool bEnd;
    bool bFailed;
    bool bNul;  // a NUL byte was read: lines are cut at their first one
    int nError;
};

// ---------------------------------------------------------------------------
// Files and paths

// Non-zero only for a regular file that can be opened for reading, or the null
// device, which reads as an empty file. Never blocks, a FIFO's path included.
DWXSERVICES_API int DKCheck(const char* path);
// Opens `path` with fopen mode `how` and remembers the path for fp2filename;
// null when it cannot be opened. `mode` is kept for compatibility (4 = read).
DWXSERVICES_API FILE* DKOpen(const char* path, int mode, const char* how);
// Closes a stream and forgets its path; returns fclose's result. A null
// stream is ignored (0).
DWXSERVICES_API int DKClose(FILE* stream);
// The next line of the stream without its line end; null at the end. Borrowed:
// valid until the next DKReadLine call of the same thread.
DWXSERVICES_API char* DKReadLine(FILE* stream);
// The path given to DKOpen for this stream, the same pointer on every call;
// null for a stream that DKOpen did not open. Borrowed until DKClose.
DWXSERVICES_API const char* fp2filename(FILE* stream);

// Environment variables holding the directory lists behind IMPFindFile's keys
// "etc" and "pro" (entries separated by ':' or, on Windows, ';').
#define DWX_ETC_PATH_VARIABLE "DWX_ETC_PATH"
#define DWX_PRO_PATH_VARIABLE "DWX_PRO_PATH"
// Searches the directories named by `key` ("etc" or "pro") for `name`; the
// first directory holding a readable regular file wins. Caller frees with
// free(); null when not found or for an unknown key.
DWXSERVICES_API char* IMPFindFile(const char* key, const char* name);
// The file `name` in the directory of the file `includer`, as a path made of
// the two, when `name` is relative, `includer` has a directory part and the
// result is a readable regular file; null otherwise (null arguments
// included). Caller frees with free().
DWXSERVICES_API char* IMPFindFileNextTo(const char* includer, const char* name);
// A heap copy of `text` with $NAME and ${NAME} replaced by the environment
// variable's value; an unset variable gives an empty text, and a '$' not
// followed by a name (or "${" without its "}") stays as it is. Null gives
// null. Caller frees with free().
DWXSERVICES_API char* HStringExpand(const char* text);

// ---------------------------------------------------------------------------
// Text

// The first character of `text` that is not white space (the terminator for a
// blank text); null for null.
DWXSERVICES_API char* LSCGetFirstNonWhiteSpace(char* text);
DWXSERVICES_API const char* LSCGetFirstNonWhiteSpace(const char* text);
// Cuts trailing white space in place and returns `text`.
DWXSERVICES_API char* LSCEatWSBack(char* text);

// Removes leading and trailing white space in place and returns the string.
DWXSERVICES_API std::string& TrimWhitespace(std::string& text);
// The index of the first non-white character at or after `position`, or npos.
DWXSERVICES_API std::string::size_type FindFirstNonWhitespace(const std::string& text,
                                                              std::string::size_type position = 0);
// The index of the last non-white character at or before `position`, or npos.
DWXSERVICES_API std::string::size_type FindLastNonWhitespace(
    const std::string& text, std::string::size_type position = std::string::npos);

// printf-style formatting into a new heap string of the right size. Caller frees with free().
DWXSERVICES_API char* HSPrintf(const char* format, ...)
#if defined(__GNUC__)
    __attribute__((format(printf, 1, 2)))
#endif
    ;

// With kind 10: today's local date as "day-month-year" (e.g. "6-12-2026").
// Other kinds give "day-month-year hour:minute:second". `unused` is ignored.
// Borrowed: valid until the next IMPTime call of the same thread.
DWXSERVICES_API const char* IMPTime(const void* unused, int kind);

// ---------------------------------------------------------------------------
// Reporting

namespace tzn {

// Raised by IMPError for severity 1. what() is the message.
class DWXSERVICES_API Exception : public std::exception {
  public:
    Exception(int code, int severity, const char* message);
    const char* what() const noexcept override;
    int Code() const noexcept { return nCode; }
    int Severity() const noexcept { return nSeverity; }

  private:
    int nCode;
    int nSeverity;
    std::string oMessage;
};

}  // namespace tzn

typedef void (*IMPErrorHandler)(int code, int severity, const char* message);
// Installs the handler every IMPError report goes to; null restores the
// default, which writes one line to stderr. Returns the previous handler (the
// default one when none was installed), so a handler may pass reports on.
DWXSERVICES_API IMPErrorHandler IMPSetErrorHandler(IMPErrorHandler handler);
// Reports to the installed handler. Severity 1 then throws tzn::Exception;
// every other severity returns.
DWXSERVICES_API void IMPError(int code, int severity, const char* message);

// Runs `callback` once at process exit; the last registered runs first. A
// callback may register further callbacks; they run too. `sourceFile` and
// `line` name the registering place in diagnostics.
DWXSERVICES_API void _IMPAtExit(void (*callback)(), const char* sourceFile, int line);

// ---------------------------------------------------------------------------
// Preferences

// Base class of preference formats, which convert values to and from the
// texts a PreferenceModel stores.
class DWXSERVICES_API PreferenceFormatIF {
  protected:
    PreferenceFormatIF();

  public:
    virtual ~PreferenceFormatIF();
};

// A host's preference store: texts under keys.
class DWXSERVICES_API PreferenceModel {
  public:
    virtual ~PreferenceModel();
    // Stores `text` under `key`; true on success. The model keeps its own copy.
    virtual bool StorePreference(const char* key, char* text) = 0;
    // The text stored under `key`, or null. Borrowed from the model.
    virtual const char* LookupPreference(const char* key) = 0;
};
