// Preference stores shared by the colour fuzz target and the unit tests: a
// host's own store, and the parse tree's model checked through its file.
#pragma once

#include <dwxcore/dwxcolorpref.h>
#include <dwxcore/dwxparse.h>
#include <dwxcore/dwxprefmodel.h>

#include <stdlib.h>

#include <map>
#include <string>
#include <vector>

// A host's store: case-sensitive keys, a record of every lookup, a switch to
// refuse stores. With bOneBuffer every text comes out of one buffer that the
// next lookup overwrites.
class MapModel : public PreferenceModel {
  public:
    bool StorePreference(const char* key, char* text) override {
        if (bAccept) {
            oTexts[key ? key : ""] = text ? text : "";
        }
        return bAccept;
    }
    const char* LookupPreference(const char* key) override {
        oLookups.push_back(key ? key : "(null)");
        auto found = oTexts.find(key ? key : "");
        if (found == oTexts.end()) {
            return nullptr;
        }
        oBuffer = found->second;
        return bOneBuffer ? oBuffer.c_str() : found->second.c_str();
    }

    std::map<std::string, std::string> oTexts;
    std::vector<std::string> oLookups;
    std::string oBuffer;
    bool bAccept = true;
    bool bOneBuffer = false;
};

// What the parse tree's model gives for `text` stored under `key` once the
// tree is written and read again; "(refused)" when it does not store it.
inline std::string StoredAndReread(const std::string& key, std::string text) {
    PTNSubTree tree("prefs");
    PTNPreferenceModel model(&tree);
    if (!model.StorePreference(key.c_str(), &text[0])) {
        return "(refused)";
    }
    char* written = tree.GetAsString();
    PTNSubTree file("file");
    bool read = true;
    try {
        file.BuildFromString(written);
    } catch (const tzn::Exception&) {
        read = false;
    }
    free(written);
    auto* prefs = read ? dynamic_cast<PTNSubTree*>(file.GetChild("prefs")) : nullptr;
    const char* value = prefs ? PTNPreferenceModel(prefs).LookupPreference(key.c_str()) : nullptr;
    return value ? value : "(lost)";
}
