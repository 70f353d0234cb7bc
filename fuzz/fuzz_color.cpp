// Colours from arbitrary texts: SetByName either sets an opaque colour or
// leaves the colour alone; the names a colour gives (GetName, GetRGBName)
// read back to its components; the preference format reads any stored text
// safely and reads back what it stored; the parse tree preference model
// accepts only what survives a written and re-read file.
#include <dwxcore/dwxcolor.h>

#include "fuzz_input.h"
#include "pref_models.h"

#include <memory>

namespace {

// A few names only, so that the process-wide registry stays small over a run.
const char* const kNames[] = {"Sky", "sea", "Grass", "Red", "RGB:1 2 3", ""};

bool SameRGB(const DWXColor& a, const DWXColor& b) {
    return a.GetRed() == b.GetRed() && a.GetGreen() == b.GetGreen() && a.GetBlue() == b.GetBlue();
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
    if (color.SetByName(input.Text(64).c_str())) {
        FUZZ_CHECK(color.GetAlpha() == 255);
    } else {
        FUZZ_CHECK(color == before && color.GetAlpha() == before.GetAlpha());
    }
    for (const DWXString& name : {color.GetRGBName(), color.GetName()}) {
        DWXColor back;
        FUZZ_CHECK(back.SetByName(static_cast<const char*>(name)) && SameRGB(back, color));
    }

    // Preference texts under one key and under the three component keys.
    MapModel model;
    model.oTexts = {{"Color", input.Text(64)}, {"BackRedColor", input.Text(16)}};
    model.oTexts["BackGreenColor"] = model.oTexts["Color"];
    model.oTexts["BackBlueColor"] = model.oTexts["BackRedColor"];
    DWXColorPreferenceFormat format(&model);
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

    const std::string key = input.Text(24).c_str(), text = input.Rest().c_str();
    const std::string back = StoredAndReread(key, text);
    FUZZ_CHECK(back == text || back == "(refused)");
    return 0;
}
