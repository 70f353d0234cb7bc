// Colours: names, RGB texts, and colours kept as preferences in a
// configuration file. Usage: colors CONFIG
#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxprefmodel.h>
#include <services/utilhub.h>

#include <stdio.h>
#include <stdlib.h>

int main(int argc, char** argv) {
    DWXColor orange;
    orange.SetByName("orange");
    DWXColor odd(10, 20, 30);
    printf("%s, %s\n", static_cast<const char*>(orange.GetName()),
           static_cast<const char*>(odd.GetName()));

    AddNamedColor("Harbour", odd);  // hosts may add names
    printf("now %s\n", static_cast<const char*>(odd.GetName()));

    char** names = GetNamedColors();  // the array is ours, the names are not
    int count = 0;
    while (names[count]) {
        ++count;
    }
    free(names);
    printf("%d named colours\n", count);

    if (argc != 2) {
        return 0;
    }
    // Preferences live as String nodes in the window subtree of the file.
    FILE* stream = DKOpen(argv[1], 4, "r");
    if (!stream) {
        fprintf(stderr, "cannot open %s\n", argv[1]);
        return 1;
    }
    PTNSubTree file("file");
    file.BuildFromFile(stream);
    DKClose(stream);
    auto* viewer = static_cast<PTNSubTree*>(file.GetChild("viewer", "PTNSubTree"));
    auto* window =
        viewer ? static_cast<PTNSubTree*>(viewer->GetChild("window", "PTNSubTree")) : nullptr;

    PTNPreferenceModel model(window);
    DWXColorPreferenceFormat format(&model);
    DWXColor fallback(255, 255, 255);
    DWXColor* background = format.GetPreference(&fallback, "BackgroundColor");  // ours
    DWXColor* highlight = format.GetPreference(&fallback, "HighlightColor");    // from 3 keys
    printf("background %s, highlight %s\n", static_cast<const char*>(background->GetName()),
           static_cast<const char*>(highlight->GetName()));

    DWXColor* pick = &orange;
    format.SetPreference("SelectionColor", reinterpret_cast<char*>(&pick));
    printf("stored SelectionColor %s\n", model.LookupPreference("SelectionColor"));
    delete background;
    delete highlight;
    return 0;
}
