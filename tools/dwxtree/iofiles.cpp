// The tool's file-system calls (POSIX) live here and nowhere else.
#include "iofiles.h"

#include <errno.h>
#include <fcntl.h>
#include <limits.h>
#include <signal.h>
#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#include <unistd.h>

namespace dwxtree {

namespace {

// The temporary file an interruption must remove. Only one output is open
// at a time; the handler reads the path without allocating.
char gTemporary[PATH_MAX + 1];
volatile sig_atomic_t gHaveTemporary = 0;

extern "C" void RemoveTemporaryAndDie(int signal) {
    if (gHaveTemporary) {
        unlink(gTemporary);
    }
    ::signal(signal, SIG_DFL);
    raise(signal);
}

void GuardTemporary(const std::string& path) {
    static bool installed = false;
    if (!installed) {
        struct sigaction action;
        memset(&action, 0, sizeof action);
        action.sa_handler = RemoveTemporaryAndDie;
        sigemptyset(&action.sa_mask);
        for (int signal : {SIGINT, SIGTERM, SIGHUP}) {
            sigaction(signal, &action, nullptr);
        }
        installed = true;
    }
    if (path.size() < sizeof gTemporary) {
        memcpy(gTemporary, path.c_str(), path.size() + 1);
        gHaveTemporary = 1;
    }
}

void UnguardTemporary() {
    gHaveTemporary = 0;
}

std::string DirectoryOf(const std::string& path) {
    size_t slash = path.rfind('/');
    if (slash == std::string::npos) {
        return ".";
    }
    return slash == 0 ? "/" : path.substr(0, slash);
}

std::string BaseOf(const std::string& path) {
    size_t slash = path.rfind('/');
    return slash == std::string::npos ? path : path.substr(slash + 1);
}

mode_t NewFileMode() {
    mode_t mask = umask(0);
    umask(mask);
    return 0666 & ~mask;
}

}  // namespace

std::string ErrorText(int error) {
    switch (error) {
        case ENOENT:
            return "no such file";
        case EACCES:
        case EPERM:
            return "permission denied";
        case EISDIR:
            return "is a directory";
        case ENOTDIR:
            return "a component of the path is not a directory";
        case EFBIG:
            return "file too large";
        case ENOSPC:
            return "no space left on the device";
        default: {
            std::string text = strerror(error);
            if (!text.empty() && text[0] >= 'A' && text[0] <= 'Z' &&
                (text.size() < 2 || text[1] < 'A' || text[1] > 'Z')) {
                text[0] = static_cast<char>(text[0] - 'A' + 'a');
            }
            return text;
        }
    }
}

std::string UnreadableReason(const std::string& path, bool regularOnly) {
    struct stat status;
    if (stat(path.c_str(), &status) != 0) {
        return ErrorText(errno);
    }
    if (S_ISDIR(status.st_mode)) {
        return ErrorText(EISDIR);
    }
    if (regularOnly && !S_ISREG(status.st_mode)) {
        return "not a regular file";
    }
    // Non-blocking, so that testing a FIFO does not wait for a writer.
    int descriptor = open(path.c_str(), O_RDONLY | O_NONBLOCK);
    if (descriptor < 0) {
        return ErrorText(errno);
    }
    close(descriptor);
    return std::string();
}

Output::~Output() {
    Discard();
}

bool Output::Open(const std::string& path, std::string& error) {
    Discard();
    if (path.empty() || path == kStandardStream) {
        oName = "standard output";
        poStream = stdout;
        return true;
    }
    oName = path;
    oTarget = path;
    struct stat status;
    bool exists = stat(path.c_str(), &status) == 0;
    if (exists && S_ISDIR(status.st_mode)) {
        error = ErrorText(EISDIR);
        return false;
    }
    if (exists && !S_ISREG(status.st_mode)) {
        poStream = fopen(path.c_str(), "wb");
        if (!poStream) {
            error = ErrorText(errno);
            return false;
        }
        bDirect = true;
        return true;
    }
    // A file the user may not write stays so, although its directory
    // would allow replacing it.
    if (exists && access(path.c_str(), W_OK) != 0) {
        error = ErrorText(errno);
        return false;
    }
    // Replace the file a link names, not the link.
    char resolved[PATH_MAX];
    if (exists && realpath(path.c_str(), resolved)) {
        oTarget = resolved;
    }

    std::string temporary = DirectoryOf(oTarget) + "/." + BaseOf(oTarget) + ".XXXXXX";
    std::string pattern = temporary;
    int descriptor = mkstemp(&pattern[0]);
    if (descriptor < 0) {
        error = ErrorText(errno);
        return false;
    }
    oTemporary = pattern;
    GuardTemporary(oTemporary);
    // The new file keeps the permissions (and, where allowed, the owner) of
    // the one it replaces; a new file gets the usual 0666 less the umask.
    if (exists) {
        // Where the owner cannot be kept, the permission bits still are.
        if (fchown(descriptor, status.st_uid, status.st_gid) != 0) {
        }
        fchmod(descriptor, status.st_mode & 07777);
    } else {
        fchmod(descriptor, NewFileMode());
    }
    poStream = fdopen(descriptor, "wb");
    if (!poStream) {
        error = ErrorText(errno);
        close(descriptor);
        Discard();
        return false;
    }
    return true;
}

bool Output::Commit(std::string& error) {
    if (!poStream) {
        error = "nothing to write";
        return false;
    }
    if (poStream == stdout) {
        bool failed = fflush(stdout) != 0 || ferror(stdout);
        if (failed) {
            error = ErrorText(errno);
        }
        return !failed;
    }
    bool failed = fflush(poStream) != 0 || ferror(poStream);
    int saved = errno;
    if (fclose(poStream) != 0 && !failed) {
        failed = true;
        saved = errno;
    }
    poStream = nullptr;
    if (!failed && !bDirect && rename(oTemporary.c_str(), oTarget.c_str()) != 0) {
        failed = true;
        saved = errno;
    }
    if (failed) {
        error = ErrorText(saved ? saved : EIO);
        Discard();
        return false;
    }
    UnguardTemporary();
    oTemporary.clear();
    bDirect = false;
    return true;
}

void Output::Discard() {
    if (poStream && poStream != stdout) {
        fclose(poStream);
    }
    poStream = nullptr;
    if (!oTemporary.empty()) {
        UnguardTemporary();
        unlink(oTemporary.c_str());
        oTemporary.clear();
    }
    bDirect = false;
}

void IgnoreFileSizeSignal() {
#ifdef SIGXFSZ
    signal(SIGXFSZ, SIG_IGN);
#endif
}

}  // namespace dwxtree
