// Colours from arbitrary texts: SetByName either sets an opaque colour or
// leaves the colour alone; the names a colour gives (GetName, GetRGBName)
// read back to its components; the preference format reads any stored text
// safely and reads back what it stored; the parse tree preference model
// accepts only what survives a written and re-read file.
#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxprefmodel.h>

#include "fuzz_input.h"

#include <stdlib.h>
#include <string.h>

#include <map>
#include <memory>
#include <string>

namespace {

class MapModel : public PreferenceModel {
  public:
    bool StorePreference(const char* key, char* text) override {
        oValues[key ? key : ""] = text ? text : "";
        return true;
    }
    const char* LookupPreference(const char* key) override {
        auto found = oValues.find(key ? key : "");
        return found == oValues.end() ? nullptr : found->second.c_str();
    }

  private:
    std::map<std::string, std::string> oValues;
};

// A few names only, so that the process-wide registry stays small over a run.
const char* const kNames[] = {"Sky", "sea", "Grass", "Red", "RGB:1 2 3", ""};

bool SameRGB(const DWXColor& a, const DWXColor& b) {
    return a.GetRed() == b.GetRed() && a.GetGreen() == b.GetGreen() && a.GetBlue() == b.GetBlue();
}

void CheckNames(const DWXColor& color) {
    DWXColor back;
    FUZZ_CHECK(back.SetByName(static_cast<const char*>(color.GetRGBName())));
    FUZZ_CHECK(SameRGB(back, color));
    DWXColor named;
    FUZZ_CHECK(named.SetByName(static_cast<const char*>(color.GetName())));
    FUZZ_CHECK(SameRGB(named, color));
}

void CheckTreeModel(const std::string& key, const std::string& text) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree);
    std::string stored(text);
    if (!model.StorePreference(key.c_str(), &stored[0])) {
        return;
    }
    FUZZ_CHECK(text == model.LookupPreference(key.c_str()));
    char* written = tree.GetAsString();
    PTNSubTree reread("file");
    try {
        reread.BuildFromString(written);
    } catch (const tzn::Exception&) {
        FUZZ_CHECK(!"a stored preference made the file corrupt");
    }
    free(written);
    auto* prefs = dynamic_cast<PTNSubTree*>(reread.GetChild("prefs"));
    FUZZ_CHECK(prefs != nullptr);
    PTNPreferenceModel again(prefs);
    const char* value = again.LookupPreference(key.c_str());
    FUZZ_CHECK(value != nullptr && text == value);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const uint8_t* data, size_t size) {
    FuzzInput input(data, size);

    const int which = input.Range(0, 7);
    if (which < 6) {
        const int r = input.Byte(), g = input.Byte(), b = input.Byte();
        AddNamedColor(kNames[which], DWXColor(r, g, b));
    }

    const int a = input.Byte(), r = input.Byte(), g = input.Byte(), b = input.Byte();
    DWXColor color(a, r, g, b);
    const DWXColor before(color);
    const std::string name = input.Text(64);
    if (color.SetByName(name.c_str())) {
        FUZZ_CHECK(color.GetAlpha() == 255);
    } else {
        FUZZ_CHECK(color == before && color.GetAlpha() == before.GetAlpha());
    }
    CheckNames(color);

    // Preference texts under one key and under the three component keys.
    MapModel model;
    DWXColorPreferenceFormat format(&model);
    const std::string text = input.Text(64);
    const std::string red = input.Text(16);
    model.StorePreference("Color", const_cast<char*>(text.c_str()));
    model.StorePreference("BackRedColor", const_cast<char*>(red.c_str()));
    model.StorePreference("BackGreenColor", const_cast<char*>(text.c_str()));
    model.StorePreference("BackBlueColor", const_cast<char*>(red.c_str()));
    DWXColor fallback(1, 2, 3, 4);
    for (const char* key : {"Color", "BackColor", "Missing"}) {
        std::unique_ptr<DWXColor> read(format.GetPreference(&fallback, key));
        FUZZ_CHECK(read != nullptr);
        std::unique_ptr<DWXColor> none(format.GetPreference(nullptr, key));
    }
    DWXColor* pointer = &color;
    FUZZ_CHECK(format.SetPreference("Stored", reinterpret_cast<char*>(&pointer)));
    std::unique_ptr<DWXColor> stored(format.GetPreference(nullptr, "Stored"));
    FUZZ_CHECK(stored != nullptr && SameRGB(*stored, color));

    const std::string key = input.Text(24);
    CheckTreeModel(key.c_str(), input.Rest().c_str());
    return 0;
}
