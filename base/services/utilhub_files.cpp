// Files and paths: checks, streams that remember their path, line reading,
// the "etc"/"pro" search and environment expansion.
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>
#include <sys/stat.h>

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

}  // namespace

int DKCheck(const char* path) {
    if (!path || !*path) {
        return 0;
    }
    // Checked before opening, so that a FIFO never blocks the open.
    struct stat info;
    if (stat(path, &info) != 0 || !S_ISREG(info.st_mode)) {
        return 0;
    }
    FILE* file = fopen(path, "rb");
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
