// A host that calls only dwxcore: the service layer must come along with
// the library by itself, whatever the host was linked with.
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxstring.h>
#include <dwxcore/dwxversion.h>

#include <stdio.h>

int main() {
    PTNSubTree tree("file");
    tree.BuildFromString("(window SubTree\n  (width Integer 640)\n)\n");
    auto* window = static_cast<PTNSubTree*>(tree.GetChild("window"));
    int width = window ? window->GetChildAsInteger("width") : 0;
    DWXString label("width ");
    label += DWXFormat("%d", width);
    if (width != 640) {
        fprintf(stderr, "unexpected %s\n", static_cast<const char*>(label));
        return 1;
    }
    printf("consumer ok: %s, dwxcore %s\n", static_cast<const char*>(label),
           DWXCORE_VERSION_STRING);
    return 0;
}
