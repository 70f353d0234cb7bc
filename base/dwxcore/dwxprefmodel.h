// A preference store kept in a parse tree, so that preferences are written
// and read with the rest of a configuration file.
#pragma once

#include <dwxcore/dwxcore_export.h>
#include <dwxcore/dwxparse.h>

#include <services/utilhub.h>

// Keeps every preference as a PTNString child of a subtree that the host gives
// it; the key is the child's name. The model borrows the subtree: the host
// owns it, writes and reads it, and keeps it alive as long as the model.
class DWXCORE_API PTNPreferenceModel : public PreferenceModel {
  public:
    // `tree` may be null: such a model stores nothing and finds nothing.
    explicit PTNPreferenceModel(PTNSubTree* tree);
    ~PTNPreferenceModel() override;

    // Stores a copy of `text` as the value of the first PTNString child named
    // `key` (ignoring case), adding such a child at the end when there is none.
    // The caller keeps `text`. Returns false and stores nothing without a tree,
    // for a null text, and for a key or text that would not come back unchanged
    // when the tree is written to a file and read again: a null or empty key, a
    // key holding white space, control characters or '"', an include directive
    // name as key, or a text that reading would expand (such as "@@Cancel").
    bool StorePreference(const char* key, char* text) override;

    // The value of the first PTNString child named `key` (ignoring case), or
    // null when there is none, for a null key or without a tree. Borrowed from
    // the tree: valid until that preference is stored again or the tree changes.
    const char* LookupPreference(const char* key) override;

    // The subtree the preferences live in (borrowed; may be null).
    PTNSubTree* GetTree() const { return poTree; }

  private:
    PTNSubTree* poTree;
};
