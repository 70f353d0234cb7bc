// Reading configuration files the way a host does, printing every problem
// in one form, and writing trees back. The reading step and the printing of
// reports each live in one place here.
#pragma once

#include <dwxcore/dwxparse.h>

#include <stdio.h>

#include <memory>
#include <set>
#include <string>

namespace dwxtree {

enum class Severity { kError, kWarning };

// Prints one problem on stderr as "FILE:LINE: error: MESSAGE" (or
// "warning"); without a line, "FILE: error: MESSAGE"; without a file,
// "dwxtree: error: MESSAGE". When the line of the file can be read, its
// text follows on a second line, as compilers show it. Counts the report.
// Showing the line rereads the file up to it: O(size of the file).
void Report(const std::string& file, int line, Severity severity, const std::string& message);
// A problem of the tool itself (no file), counted like the others.
void Complain(const std::string& message);
// The number of reports since the program started.
int ReportCount();

// Routes the library's reports (IMPError) to Report. Installed once by main.
void InstallReportHandler();

// The name that standard input has in messages.
constexpr char kStandardInputName[] = "<stdin>";

// A file read into a root subtree that stands for the file itself: its
// children are the file's top-level nodes.
struct TreeFile {
    std::unique_ptr<PTNSubTree> root;
    // The name in messages: the path, or kStandardInputName.
    std::string name;
    // Standard input's text, kept for PTNValidateFile and report lines.
    std::string text;
    // The files that took part (the file itself and every include that was
    // found), by canonical path; filled only when asked for.
    std::set<std::string> files;
    // Reports that arose while reading (corrupt lines, missing includes,
    // include cycles).
    int reports = 0;
};

// Reads `path` ("-" is standard input) with the library's reader. The
// directory of `path` is appended to the "etc" search path (DWX_ETC_PATH)
// while reading, so includes named relative to it are found. A corrupt line
// at the outermost level is reported like every other and ends the reading;
// what was read before it stays. Returns false, after a report that says
// why, only when the file cannot be read at all: it must be a readable
// regular file, since the reader reads it by name.
bool ReadTreeFile(const std::string& path, TreeFile& out, bool listFiles = false);

// Writes the top-level nodes of `root` as the library writes them: a
// subtree through WriteToFile, a leaf as one line "(name Type value)".
// Read back, the text gives the same top-level nodes.
void WriteTopLevel(FILE* stream, const PTNSubTree& root);

// The type keyword of a node, its class name without "PTN".
const char* TypeKeyword(const DWXParseTreeNode& node);

}  // namespace dwxtree
