#include "treefile.h"

#include <dwxcore/dwxobject.h>
#include <services/tracer.h>
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>

#include <filesystem>
#include <system_error>

namespace dwxtree {

namespace {

int gReports = 0;
std::string gLastReport;

// Report texts of the library span several lines; a tool prints one line
// per problem, so line ends and the blanks around them become one blank.
std::string OneLine(const char* text) {
    std::string line;
    bool pendingBlank = false;
    for (const char* p = text ? text : ""; *p; ++p) {
        if (*p == '\n' || *p == '\r' || *p == ' ' || *p == '\t') {
            pendingBlank = !line.empty();
            continue;
        }
        if (pendingBlank) {
            line.push_back(' ');
            pendingBlank = false;
        }
        line.push_back(*p);
    }
    return line;
}

void OnReport(int /*code*/, int /*severity*/, const char* message) {
    gLastReport = message ? message : "";
    Complain(OneLine(message));
}

#ifdef _WIN32
constexpr char kListSeparator = ';';
void SetVariable(const char* name, const char* value) {
    _putenv_s(name, value ? value : "");
}
#else
constexpr char kListSeparator = ':';
void SetVariable(const char* name, const char* value) {
    if (value) {
        setenv(name, value, 1);
    } else {
        unsetenv(name);
    }
}
#endif

// Appends a directory to the "etc" search path and restores the old value
// when it goes out of scope.
class EtcPathExtension {
  public:
    explicit EtcPathExtension(const char* file) {
        const char* old = getenv(DWX_ETC_PATH_VARIABLE);
        bHadOld = old != nullptr;
        if (old) {
            oOld = old;
        }
        std::string directory = std::filesystem::path(file).parent_path().string();
        if (directory.empty()) {
            directory = ".";
        }
        std::string extended = oOld.empty() ? directory : oOld + kListSeparator + directory;
        SetVariable(DWX_ETC_PATH_VARIABLE, extended.c_str());
    }
    ~EtcPathExtension() { SetVariable(DWX_ETC_PATH_VARIABLE, bHadOld ? oOld.c_str() : nullptr); }
    EtcPathExtension(const EtcPathExtension&) = delete;
    EtcPathExtension& operator=(const EtcPathExtension&) = delete;

  private:
    bool bHadOld = false;
    std::string oOld;
};

std::string Canonical(const std::string& path) {
    std::error_code error;
    std::filesystem::path canonical = std::filesystem::weakly_canonical(path, error);
    return error ? path : canonical.string();
}

struct FreeText {
    void operator()(char* text) const { free(text); }
};
using HeapText = std::unique_ptr<char, FreeText>;

// The file an include directive reaches, searched the way the reader
// searches (as given, then "etc", then "pro"); empty when none.
std::string ResolveInclude(const std::string& token) {
    HeapText path(HStringExpand(token.c_str()));
    if (!path) {
        return std::string();
    }
    if (!DKCheck(path.get())) {
        HeapText found(IMPFindFile("etc", path.get()));
        if (!found) {
            found.reset(IMPFindFile("pro", path.get()));
        }
        if (found) {
            path = std::move(found);
        }
    }
    return DKCheck(path.get()) ? Canonical(path.get()) : std::string();
}

// The reader traces every include directive when the debug level is set;
// each trace ends in "<DIRECTIVE FILE>". Those are the files the reading
// reached.
void CollectIncludes(FILE* traces, std::set<std::string>& files) {
    rewind(traces);
    std::string all;
    char chunk[4096];
    size_t got;
    while ((got = fread(chunk, 1, sizeof chunk, traces)) > 0) {
        all.append(chunk, got);
    }
    size_t start = 0;
    while ((start = all.find('<', start)) != std::string::npos) {
        size_t blank = all.find(' ', start);
        size_t end = all.find(">\n", start);
        if (blank == std::string::npos || end == std::string::npos || blank > end) {
            break;
        }
        std::string resolved = ResolveInclude(all.substr(blank + 1, end - blank - 1));
        if (!resolved.empty()) {
            files.insert(resolved);
        }
        start = end + 2;
    }
}

// Turns include tracing on for its lifetime, into a scratch file.
class IncludeTrace {
  public:
    IncludeTrace() : poStream(tmpfile()) {
        if (poStream) {
            nOldLevel = tzn::tracer::Debugger::moDebugLevel;
            poOldStream = tzn::tracer::Debugger::SetStream(poStream);
            tzn::tracer::Debugger::moDebugLevel = 1;
        }
    }
    ~IncludeTrace() {
        if (poStream) {
            tzn::tracer::Debugger::moDebugLevel = nOldLevel;
            tzn::tracer::Debugger::SetStream(poOldStream == stderr ? nullptr : poOldStream);
            fclose(poStream);
        }
    }
    IncludeTrace(const IncludeTrace&) = delete;
    IncludeTrace& operator=(const IncludeTrace&) = delete;
    FILE* Stream() const { return poStream; }

  private:
    FILE* poStream;
    FILE* poOldStream = nullptr;
    int nOldLevel = 0;
};

}  // namespace

void InstallReportHandler() {
    IMPSetErrorHandler(OnReport);
}

int ReportCount() {
    return gReports;
}

void Complain(const std::string& message) {
    ++gReports;
    fprintf(stderr, "dwxtree: %s\n", message.c_str());
}

bool ReadTreeFile(const char* path, TreeFile& out, bool listFiles) {
    out.root = std::make_unique<PTNSubTree>(path);
    out.files.clear();
    out.reports = 0;
    FILE* stream = DKCheck(path) ? DKOpen(path, 4, "r") : nullptr;
    if (!stream) {
        Complain(std::string("cannot read '") + path + "': no such readable file");
        return false;
    }

    int before = ReportCount();
    {
        EtcPathExtension searchHere(path);
        std::unique_ptr<IncludeTrace> trace;
        if (listFiles) {
            trace = std::make_unique<IncludeTrace>();
        }
        gLastReport.clear();
        try {
            out.root->BuildFromFile(stream);
        } catch (const tzn::Exception& e) {
            // The handler has shown the report already; only a text it has
            // not seen is shown here.
            if (gLastReport != e.what()) {
                Complain(OneLine(e.what()));
            }
        }
        if (trace && trace->Stream()) {
            fflush(trace->Stream());
            CollectIncludes(trace->Stream(), out.files);
        }
    }
    DKClose(stream);
    out.files.insert(Canonical(path));
    out.reports = ReportCount() - before;
    return true;
}

const char* TypeKeyword(const DWXParseTreeNode& node) {
    const char* name = node.GetClassName();
    return strncmp(name, "PTN", 3) == 0 ? name + 3 : name;
}

void WriteTopLevel(FILE* stream, const PTNSubTree& root) {
    DWXIter iter(root.GetChildren());
    for (DWXObject* object = iter.Start(); object; object = iter.Next()) {
        auto* node = static_cast<DWXParseTreeNode*>(object);
        if (auto* subtree = dynamic_cast<PTNSubTree*>(node)) {
            subtree->WriteToFile(stream);
            continue;
        }
        HeapText value(node->GetAsString());
        fprintf(stream, "(%s %s %s)\n", node->GetName(), TypeKeyword(*node),
                value ? value.get() : "");
    }
}

}  // namespace dwxtree
