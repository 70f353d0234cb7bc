// Where dwxtree's bytes come from and go to: the one wording of "cannot
// read", and outputs that replace their file only when complete.
#pragma once

#include <stdio.h>

#include <string>

namespace dwxtree {

// The operand that stands for standard input or standard output.
constexpr char kStandardStream[] = "-";

// Why `path` cannot be read, as the end of "cannot read: ...": "no such
// file", "permission denied", "is a directory", "not a regular file" (only
// when `regularOnly`) or the system's text for any other failure. Empty when
// the file opens for reading.
std::string UnreadableReason(const std::string& path, bool regularOnly);

// The system's text for an errno value, in the same wording.
std::string ErrorText(int error);

// The destination of a command: standard output, or a file that is
// replaced in one step. A file is written as a temporary file in the same
// directory, which Commit renames over the target; until then the target
// keeps its old content, and a failure or Discard removes the temporary,
// also when the process is interrupted by SIGINT, SIGTERM or SIGHUP.
// A target that exists but is not a regular file (a device, a FIFO) is
// written directly; one the user may not write is refused. Symbolic links are followed, so the file
// they name is replaced, not the link.
class Output {
  public:
    Output() = default;
    ~Output();
    Output(const Output&) = delete;
    Output& operator=(const Output&) = delete;

    // `path` empty or "-" is standard output. False, with the reason in
    // `error`, when the target cannot be written.
    bool Open(const std::string& path, std::string& error);
    FILE* Stream() const { return poStream; }
    // The name for messages: the path, or "standard output".
    const std::string& Name() const { return oName; }
    // True while a temporary file stands in for the target.
    bool Replacing() const { return !oTemporary.empty(); }

    // Flushes and checks every write; for a file, closes it and renames
    // the temporary over the target. False, with the reason in `error`,
    // when anything failed; the target is then unchanged.
    bool Commit(std::string& error);
    // Forgets what was written: the target stays unchanged.
    void Discard();

  private:
    FILE* poStream = nullptr;
    std::string oName;
    std::string oTarget;     // the file to replace (links resolved)
    std::string oTemporary;  // the file written until Commit
    bool bDirect = false;    // a non-regular target written in place
};

// Makes a file size limit a failed write (EFBIG) instead of a signal that
// ends the process before it can clean up. Called once by main.
void IgnoreFileSizeSignal();

}  // namespace dwxtree
