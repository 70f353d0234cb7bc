#include <dwxcore/dwxprefmodel.h>

#include <services/portability.h>
#include <services/rtprim.h>

#include "internal/dwxparse_kinds.h"

#include <stdlib.h>
#include <string.h>

#include <memory>

namespace {

// A node name survives the text form only when the reader takes it as the
// same single token: no white space, no quote mark, no control character,
// and not one of the include directives the reader acts on.
bool IsStorableKey(const char* key) {
    if (key == nullptr || *key == '\0') {
        return false;
    }
    for (const unsigned char* c = reinterpret_cast<const unsigned char*>(key); *c != 0; ++c) {
        if (*c <= ' ' || *c == 127 || *c == '"') {
            return false;
        }
    }
    bool required = false;
    return !dwxcore::internal::IsIncludeDirective(key, required);
}

// Reading a String value expands translation and list forms; a text that
// such an expansion would change cannot be stored faithfully. The test runs
// the text through the same quoting and unquoting the writer and reader use.
bool ReadsBackUnchanged(const char* text) {
    PTNString written("value", text);
    HeapText token(written.GetAsString());
    PTNString read("value", nullptr);
    read.SetAsString(token.get());
    return read.GetValue() != nullptr && strcmp(read.GetValue(), text) == 0;
}

}  // namespace

PTNPreferenceModel::PTNPreferenceModel(PTNSubTree* tree) : poTree(tree) {}

PTNPreferenceModel::~PTNPreferenceModel() {}

bool PTNPreferenceModel::StorePreference(const char* key, char* text) {
    if (poTree == nullptr || text == nullptr || !IsStorableKey(key) || !ReadsBackUnchanged(text)) {
        return false;
    }
    if (auto* node = static_cast<PTNString*>(poTree->GetChild(key, "PTNString"))) {
        node->SetValue(text);
    } else {
        poTree->AddChild(new PTNString(key, text));
    }
    return true;
}

const char* PTNPreferenceModel::LookupPreference(const char* key) {
    if (poTree == nullptr || key == nullptr) {
        return nullptr;
    }
    const auto* node = static_cast<const PTNString*>(poTree->GetChild(key, "PTNString"));
    return node != nullptr ? node->GetValue() : nullptr;
}
