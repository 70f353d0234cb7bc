// Reading configuration files the way a host does, printing every problem
// in one form, and writing trees back. The reading step and the printing of
// reports each live in one place here.
#pragma once

#include <dwxcore/dwxparse.h>

#include <stdio.h>

#include <memory>
#include <string>
#include <vector>

namespace dwxtree {

enum class Severity { kError, kWarning };

// Prints one problem on stderr as "FILE:LINE: error: MESSAGE" (or
// "warning"); without a line, "FILE: error: MESSAGE"; without a file,
// "dwxtree: error: MESSAGE". When the line of the file can be read, its
// text follows on a second line, as compilers show it.
// Showing the line rereads the file up to it: O(size of the file).
void Report(const std::string& file, int line, Severity severity, const std::string& message);
// A problem of the tool itself (no file).
void Complain(const std::string& message);

// Routes what the library reports outside a read (IMPError) to Report.
// Reads report to their own log instead. Installed once by main.
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
    // What the read met: its reports (corrupt lines, includes missing or
    // refused), its warnings (lines dropped or read otherwise than they
    // look) and the files it opened.
    PTNReadLog log;
};

// Reads `path` ("-" is standard input) with the library's reader and prints
// every report and warning of the read through Report. A corrupt line at
// the outermost level ends the reading; what was read before it stays.
// Returns false, after a report that says why, only when the file cannot be
// read at all: it must be a readable regular file, since the reader reads
// it by name.
bool ReadTreeFile(const std::string& path, TreeFile& out);

// The files the read took part in, as the reader named them: the file
// itself first (kStandardInputName for standard input), then each include
// it opened, once each, in the order first opened.
std::vector<std::string> FilesRead(const TreeFile& file);

// The name of a node's source file in messages: the top-level source is
// the file's own name (so standard input is kStandardInputName).
std::string SourceName(const TreeFile& file, const PTNSourceFile& source);

// Writes the top-level nodes of `root` as the library writes them: a
// subtree through WriteToFile, a leaf as one line "(name Type value)".
// Read back, the text gives the same top-level nodes.
void WriteTopLevel(FILE* stream, const PTNSubTree& root);

}  // namespace dwxtree
