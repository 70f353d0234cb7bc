#include <dwxcore/dwxcolorpref.h>

#include "internal/dwxcolor_scan.h"

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>

#include <string>

// The one instance of the template, exported through its declaration in the header.
template class PreferenceFormat<DWXColor*>;

namespace {

using dwxcore::internal::ComponentOf;

DWXColor* CopyOf(const DWXColor* color) {
    return color != nullptr ? new DWXColor(*color) : nullptr;
}

// "10,20,30" as a new colour; null unless the text has exactly three pieces.
DWXColor* ParseColorText(const char* text) {
    char** pieces = TokenizeDelim(text, ",");
    DWXColor* color = nullptr;
    if (CountStringList(pieces) == 3) {
        color =
            new DWXColor(ComponentOf(pieces[0]), ComponentOf(pieces[1]), ComponentOf(pieces[2]));
    }
    DestroyStringList(pieces);
    return color;
}

}  // namespace

DWXColorPreferenceFormat::DWXColorPreferenceFormat(PreferenceModel* model)
    : PreferenceFormat<DWXColor*>(model) {}

DWXColorPreferenceFormat::DWXColorPreferenceFormat(const DWXColorPreferenceFormat& other)
    : PreferenceFormat<DWXColor*>(other) {}

DWXColorPreferenceFormat& DWXColorPreferenceFormat::operator=(
    const DWXColorPreferenceFormat& other) {
    PreferenceFormat<DWXColor*>::operator=(other);
    return *this;
}

DWXColorPreferenceFormat::~DWXColorPreferenceFormat() {}

bool DWXColorPreferenceFormat::SetPreference(const char* key, char* data) {
    if (poModel == nullptr || data == nullptr) {
        return false;
    }
    const DWXColor* color = *reinterpret_cast<DWXColor**>(data);
    if (color == nullptr) {
        return false;
    }
    // The text belongs to MkName; the model keeps its own copy.
    char* text = MkName("%d,%d,%d", color->GetRed(), color->GetGreen(), color->GetBlue());
    return poModel->StorePreference(key, text);
}

DWXColor* DWXColorPreferenceFormat::GetPreference(DWXColor* defaultColor, const char* key) {
    if (poModel == nullptr) {
        return CopyOf(defaultColor);
    }
    if (const char* value = poModel->LookupPreference(key)) {
        // A malformed value gives the default; it never leads to the component keys.
        DWXColor* color = ParseColorText(value);
        return color != nullptr ? color : CopyOf(defaultColor);
    }

    // Only a key whose first "Color" is its last five characters has component keys,
    // so "ColorColor" and keys without "Color" fall to the default.
    const std::string name = key != nullptr ? key : "";
    const std::string::size_type at = name.find("Color");
    if (at == std::string::npos || at + 5 != name.size()) {
        return CopyOf(defaultColor);
    }
    const std::string prefix = name.substr(0, at);
    // Every component is read at once: a model may reuse its buffer on the next
    // lookup. All three keys are looked up before any is tested.
    int components[3] = {0, 0, 0};
    bool complete = true;
    const char* const kComponentKeys[3] = {"RedColor", "GreenColor", "BlueColor"};
    for (int i = 0; i < 3; ++i) {
        const char* text = poModel->LookupPreference((prefix + kComponentKeys[i]).c_str());
        if (text != nullptr) {
            components[i] = ComponentOf(text);
        } else {
            complete = false;
        }
    }
    if (!complete) {
        return CopyOf(defaultColor);
    }
    return new DWXColor(components[0], components[1], components[2]);
}
