// The colour preference format: colours stored in a host's PreferenceModel as
// the text "red,green,blue" (for example "255,128,0").
#pragma once

#include <dwxcore/dwxcolor.h>
#include <dwxcore/dwxcore_export.h>

#include <services/utilhub.h>

// A preference format for values of type T, bound to a model that it does not
// own and never deletes (the model may be null).
template <class T>
class PreferenceFormat : public PreferenceFormatIF {
  protected:
    explicit PreferenceFormat(PreferenceModel* model) : poModel(model) {}
    PreferenceFormat(const PreferenceFormat& other) = default;
    PreferenceFormat& operator=(const PreferenceFormat& other) = default;

  public:
    ~PreferenceFormat() override {}

    // Stores the value that `data` points to under `key`; `data` is the address
    // of a variable of type T. True when the model stored it.
    virtual bool SetPreference(const char* key, char* data) = 0;
    // A new value read from the model, or one made from `defaultValue`.
    virtual T GetPreference(T defaultValue, const char* key) = 0;

  protected:
    PreferenceModel* poModel;
};

extern template class DWXCORE_API PreferenceFormat<DWXColor*>;

// Colours under one key as "%d,%d,%d" (alpha is neither written nor read). A key
// ending in its only "Color", such as "BackgroundColor", may instead be read
// from the three keys "BackgroundRedColor", "BackgroundGreenColor" and
// "BackgroundBlueColor".
class DWXCORE_API DWXColorPreferenceFormat : public PreferenceFormat<DWXColor*> {
  public:
    explicit DWXColorPreferenceFormat(PreferenceModel* model);
    DWXColorPreferenceFormat(const DWXColorPreferenceFormat& other);
    DWXColorPreferenceFormat& operator=(const DWXColorPreferenceFormat& other);
    ~DWXColorPreferenceFormat() override;

    // `data` is the address of a DWXColor* variable. False without a model or
    // without a colour; otherwise what the model's StorePreference answers.
    bool SetPreference(const char* key, char* data) override;
    // A new colour (alpha 255) read from the text under `key`, or from the three
    // component keys when `key` has no text; otherwise a new copy of
    // `defaultColor` (alpha kept), or null when that is null. A text that is
    // present but not exactly three comma-separated pieces gives the default.
    // The caller deletes the result.
    DWXColor* GetPreference(DWXColor* defaultColor, const char* key) override;
};
