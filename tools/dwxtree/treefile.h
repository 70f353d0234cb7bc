// Reading configuration files the way a host does, with the library's
// reports shown on stderr, and writing trees back.
#pragma once

#include <dwxcore/dwxparse.h>

#include <stdio.h>

#include <memory>
#include <set>
#include <string>

namespace dwxtree {

// Routes the library's reports (IMPError) to stderr, one line each, prefixed
// with "dwxtree: ", and counts them. Installed once by main.
void InstallReportHandler();
// The number of reports since the program started.
int ReportCount();
// Prints a message of the tool itself in the same form as a report (one
// line on stderr) and counts it as a report.
void Complain(const std::string& message);

// A file read into a root subtree that stands for the file itself: its
// children are the file's top-level nodes.
struct TreeFile {
    std::unique_ptr<PTNSubTree> root;
    // The files that took part (the file itself and every include that was
    // found), by canonical path; filled only when asked for.
    std::set<std::string> files;
    // Reports that arose while reading (corrupt lines, missing includes,
    // include cycles).
    int reports = 0;
};

// Reads `path` with BuildFromFile. The directory of `path` is appended to
// the "etc" search path (DWX_ETC_PATH) while reading, so includes named
// relative to it are found. A corrupt line at the outermost level is
// reported like every other and ends the reading; what was read before it
// stays. Returns false, after a message, only when the file cannot be opened.
bool ReadTreeFile(const char* path, TreeFile& out, bool listFiles = false);

// Writes the top-level nodes of `root` as the library writes them: a
// subtree through WriteToFile, a leaf as one line "(name Type value)".
// Read back, the text gives the same top-level nodes.
void WriteTopLevel(FILE* stream, const PTNSubTree& root);

// The type keyword of a node, its class name without "PTN".
const char* TypeKeyword(const DWXParseTreeNode& node);

}  // namespace dwxtree
