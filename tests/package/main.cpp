// A host that calls only dwxcore: the service layer must come along with
// the library by itself, whatever the host was linked with.
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxstring.h>
#include <dwxcore/dwxversion.h>

#include <stdio.h>
#include <string.h>

int main() {
    PTNSubTree tree("file");
    tree.BuildFromString("(window SubTree\n  (width Integer 640)\n)\n");
    auto* window = static_cast<PTNSubTree*>(tree.GetChild("window"));
    DWXString label = DWXFormat("width %d", window ? window->GetChildAsInteger("width") : 0);
    const bool ok = strcmp(static_cast<const char*>(label), "width 640") == 0;
    printf("consumer %s: %s, dwxcore %s\n", ok ? "ok" : "FAILED", static_cast<const char*>(label),
           DWXCORE_VERSION_STRING);
    return ok ? 0 : 1;
}
