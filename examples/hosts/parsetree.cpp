// Reading a configuration file, asking for values, merging a user's changes
// and writing the result. Usage: parsetree CONFIG USER_CONFIG
#include <dwxcore/dwxparse.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>

static int gReports = 0;

// Every report of the reader (a missing include, a corrupt line) comes here.
static void OnReport(int code, int severity, const char* message) {
    ++gReports;
    fprintf(stderr, "report %d/%d: %s", code, severity, message);
}

// Reads a file into `tree`; false when it cannot be opened or was corrupt.
static bool Read(const char* path, PTNSubTree& tree) {
    FILE* stream = DKOpen(path, 4, "r");
    if (!stream) {
        fprintf(stderr, "cannot open %s\n", path);
        return false;
    }
    bool ok = true;
    try {
        tree.BuildFromFile(stream);
    } catch (const tzn::Exception& e) {
        // A corrupt line outside every subtree; what came before it is kept.
        ok = false;
    }
    DKClose(stream);
    return ok;
}

int main(int argc, char** argv) {
    if (argc != 3) {
        fprintf(stderr, "usage: parsetree CONFIG USER_CONFIG\n");
        return 2;
    }
    IMPSetErrorHandler(OnReport);

    PTNSubTree config("file");
    PTNSubTree user("file");
    if (!Read(argv[1], config) || !Read(argv[2], user) || gReports > 0) {
        return 1;
    }

    // Lookups are borrowed pointers into the tree; names ignore case.
    auto* viewer = static_cast<PTNSubTree*>(config.GetChild("viewer", "PTNSubTree"));
    auto* window = static_cast<PTNSubTree*>(viewer->GetChild("window", "PTNSubTree"));
    printf("title %s, build %d, version %g\n", viewer->GetChildAsString("title"),
           viewer->GetChildAsInteger("build"), viewer->GetChildAsDouble("version"));
    printf("window %dx%d\n", window->GetChildAsInteger("width"),
           window->GetChildAsInteger("height"));

    // Classes without a one-call reader: GetChild with the class name.
    auto* zoom = static_cast<PTNDoubleList*>(window->GetChild("zoomSteps", "PTNDoubleList"));
    int count = 0;
    double* steps = zoom->GetValue(&count);
    printf("%d zoom steps, largest %g\n", count, steps[count - 1]);
    auto* signature = static_cast<PTNBase64*>(viewer->GetChild("signature", "PTNBase64"));
    unsigned int length = 0;
    unsigned char* bytes = signature->Decode(nullptr, &length);  // ours to free
    printf("signature %.*s\n", static_cast<int>(length), reinterpret_cast<char*>(bytes));
    free(bytes);

    // Take the user's values, but keep the network settings as they are.
    ExceptionList keep;
    keep.Add("network");
    config.SetFrom(&user, keep);
    printf("after merge: title %s, width %d\n", viewer->GetChildAsString("title"),
           window->GetChildAsInteger("width"));

    // A tree built in memory, written in the text format.
    PTNSubTree recent("recent");
    recent.AddChild(new PTNString("last", "harbour.jpg"));  // the tree owns it now
    recent.AddChild(new PTNInteger("count", 1));
    recent.WriteToFile(stdout);
    return 0;
}
