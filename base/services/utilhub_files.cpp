// Files and paths: checks, streams that remember their path, line reading,
// the "etc"/"pro" search and environment expansion.
#include <services/utilhub.h>

#include "internal/utilhub_internal.h"

#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>
#if !defined(_WIN32)
#include <fcntl.h>
#include <unistd.h>
#endif

#include <filesystem>
#include <mutex>
#include <string>
#include <unordered_map>

namespace {

#if defined(_WIN32)
constexpr char kPathListSeparator = ';';
#else
constexpr char kPathListSeparator = ':';
#endif

// The paths of the streams that DKOpen opened. The table is never destroyed,
// so streams closed from static destructors or exit callbacks still find it.
struct StreamTable {
    std::mutex lock;
    std::unordered_map<FILE*, std::string> paths;  // node-based: c_str() stays put
};

StreamTable& Streams() {
    static StreamTable* table = new StreamTable;
    return *table;
}

// Environment names are ASCII letters, digits and '_', whatever the locale
// says about other bytes.
bool IsNameStart(char c) {
    return (AsciiLower(static_cast<unsigned char>(c)) >= 'a' &&
            AsciiLower(static_cast<unsigned char>(c)) <= 'z') ||
           c == '_';
}

bool IsNameChar(char c) {
    return IsNameStart(c) || (c >= '0' && c <= '9');
}

#if !defined(_WIN32)
// The null device, known by its device number so that another name for it
// (a link, a bind mount) is the null device too.
bool IsNullDevice(const struct stat& info) {
    static const struct NullDevice {
        bool known;
        dev_t device;
        NullDevice() : known(false), device() {
            struct stat null;
            if (stat("/dev/null", &null) == 0 && S_ISCHR(null.st_mode)) {
                known = true;
                device = null.st_rdev;
            }
        }
    } kNull;
    return kNull.known && S_ISCHR(info.st_mode) && info.st_rdev == kNull.device;
}

bool IsReadableKind(const struct stat& info) {
    return S_ISREG(info.st_mode) || IsNullDevice(info);
}
#endif

}  // namespace

FILE* dwxservices::internal::OpenReadableFile(const char* path) {
    if (!path || !*path) {
        return nullptr;
    }
#if defined(_WIN32)
    struct stat info;
    if (stat(path, &info) != 0 || !S_ISREG(info.st_mode)) {
        return nullptr;
    }
    return fopen(path, "rb");
#else
    // Checked before opening, since opening some devices has effects of its
    // own; checked again on the open descriptor, which a non-blocking open
    // gets at once even for a FIFO that replaced the file in between.
    struct stat info;
    if (stat(path, &info) != 0 || !IsReadableKind(info)) {
        return nullptr;
    }
    int fd = open(path, O_RDONLY | O_NONBLOCK | O_NOCTTY | O_CLOEXEC);
    if (fd < 0) {
        return nullptr;
    }
    int flags = fcntl(fd, F_GETFL);
    if (fstat(fd, &info) != 0 || !IsReadableKind(info) || flags < 0 ||
        fcntl(fd, F_SETFL, flags & ~O_NONBLOCK) != 0) {
        close(fd);
        return nullptr;
    }
    FILE* file = fdopen(fd, "rb");
    if (!file) {
        close(fd);
    }
    return file;
#endif
}

int DKCheck(const char* path) {
    FILE* file = dwxservices::internal::OpenReadableFile(path);
    if (!file) {
        return 0;
    }
    fclose(file);
    return 1;
}

FILE* DKOpen(const char* path, int mode, const char* how) {
    (void)mode;
    if (!path) {
        return nullptr;
    }
    FILE* stream = fopen(path, how ? how : "r");
    if (stream) {
        StreamTable& table = Streams();
        std::lock_guard<std::mutex> guard(table.lock);
        table.paths[stream] = path;
    }
    return stream;
}

int DKClose(FILE* stream) {
    if (!stream) {
        return 0;
    }
    {
        StreamTable& table = Streams();
        std::lock_guard<std::mutex> guard(table.lock);
        table.paths.erase(stream);
    }
    return fclose(stream);
}

const char* fp2filename(FILE* stream) {
    if (!stream) {
        return nullptr;
    }
    StreamTable& table = Streams();
    std::lock_guard<std::mutex> guard(table.lock);
    auto found = table.paths.find(stream);
    return found == table.paths.end() ? nullptr : found->second.c_str();
}

char* DKReadLine(FILE* stream) {
    thread_local std::string line;
    if (!stream) {
        return nullptr;
    }
    line.clear();
    int c;
    while ((c = getc(stream)) != EOF && c != '\n') {
        line.push_back(static_cast<char>(c));
    }
    if (c == EOF && line.empty()) {
        return nullptr;
    }
    if (!line.empty() && line.back() == '\r') {
        line.pop_back();
    }
    return &line[0];
}

char* IMPFindFile(const char* key, const char* name) {
    if (!key || !name || !*name) {
        return nullptr;
    }
    const char* variable = nullptr;
    if (_stricmp(key, "etc") == 0) {
        variable = DWX_ETC_PATH_VARIABLE;
    } else if (_stricmp(key, "pro") == 0) {
        variable = DWX_PRO_PATH_VARIABLE;
    } else {
        return nullptr;
    }
    const char* directories = getenv(variable);
    if (!directories) {
        return nullptr;
    }
    std::string candidate;
    for (const char* p = directories; *p;) {
        const char* end = strchr(p, kPathListSeparator);
        if (!end) {
            end = p + strlen(p);
        }
        if (end > p) {
            candidate.assign(p, end);
            if (candidate.back() != '/') {
                candidate.push_back('/');
            }
            candidate.append(name);
            if (DKCheck(candidate.c_str())) {
                return HString(candidate.c_str());
            }
        }
        p = *end ? end + 1 : end;
    }
    return nullptr;
}

char* IMPFindFileNextTo(const char* includer, const char* name) {
    if (!includer || !name || !*name) {
        return nullptr;
    }
    const std::filesystem::path relative(name);
    const std::filesystem::path directory = std::filesystem::path(includer).parent_path();
    if (relative.is_absolute() || relative.has_root_name() || directory.empty()) {
        return nullptr;
    }
    const std::string candidate = (directory / relative).string();
    return DKCheck(candidate.c_str()) ? HString(candidate.c_str()) : nullptr;
}

char* HStringExpand(const char* text) {
    if (!text) {
        return nullptr;
    }
    std::string result;
    result.reserve(strlen(text));
    std::string name;
    for (const char* p = text; *p;) {
        if (*p != '$') {
            const char* next = strchr(p, '$');
            if (!next) {
                next = p + strlen(p);
            }
            result.append(p, next);
            p = next;
            continue;
        }
        // "$NAME" or "${NAME}"; anything else keeps its '$'.
        bool braced = p[1] == '{';
        const char* start = p + (braced ? 2 : 1);
        const char* end = start;
        if (IsNameStart(*end)) {
            while (IsNameChar(*end)) {
                ++end;
            }
        }
        if (end == start || (braced && *end != '}')) {
            result.push_back('$');
            ++p;
            continue;
        }
        name.assign(start, end);
        if (const char* value = getenv(name.c_str())) {
            result.append(value);
        }
        p = braced ? end + 1 : end;
    }
    return HString(result.c_str());
}
