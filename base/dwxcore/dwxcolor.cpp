#include <dwxcore/dwxcolor.h>

#include "internal/dwxcolor_scan.h"

#include <services/rtprim.h>
#include <services/utilhub.h>

#include <stdlib.h>
#include <string.h>

#include <atomic>
#include <mutex>

namespace {

struct ColorRow {
    const char* name;
    unsigned char red;
    unsigned char green;
    unsigned char blue;
};

constexpr int kTableRows = 13;

// The built-in names, written with Grey. Pink and Magenta share their
// components, and LightGrey is 196, not 192: stored files rely on both.
const ColorRow kBuiltinColors[kTableRows] = {
    {"White", 255, 255, 255}, {"Red", 255, 0, 0},       {"Green", 0, 255, 0},
    {"Blue", 0, 0, 255},      {"Yellow", 255, 255, 0},  {"Black", 0, 0, 0},
    {"Orange", 255, 128, 0},  {"Magenta", 255, 0, 255}, {"Cyan", 0, 255, 255},
    {"Grey", 128, 128, 128},  {"DarkGrey", 64, 64, 64}, {"LightGrey", 196, 196, 196},
    {"Pink", 255, 0, 255},
};

// The same rows under their display names (written with Gray), translated once
// when the library is loaded. The registry is seeded from this table.
struct DisplayTable {
    ColorRow rows[kTableRows];
    DisplayTable() {
        static const char* const kEnglish[kTableRows] = {
            "White",   "Red",  "Green", "Blue",     "Yellow",    "Black", "Orange",
            "Magenta", "Cyan", "Gray",  "DarkGray", "LightGray", "Pink"};
        for (int i = 0; i < kTableRows; ++i) {
            rows[i] = kBuiltinColors[i];
            rows[i].name = _(kEnglish[i]);
        }
    }
};
const DisplayTable gDisplayColors;

// One registered name. Entries keep no alpha.
struct NamedColor {
    char* name;  // own heap copy
    unsigned char red;
    unsigned char green;
    unsigned char blue;
};

// The process-wide registry: made on first use, released at exit. Entries stay
// in order of registration; names are unique ignoring case.
//
// Threads: the first use may come from several threads at once, so making
// the registry is locked, and gReady publishes it; lookups then read it
// without a lock. Additions take the lock too, but a lookup on another
// thread during an addition is the host's race to avoid.
NamedColor** gEntries = nullptr;
int gEntryCount = 0;
std::mutex gRegistryLock;
std::atomic<bool> gReady{false};

void ReleaseRegistry() {
    std::lock_guard<std::mutex> guard(gRegistryLock);
    gReady.store(false, std::memory_order_relaxed);
    for (int i = 0; i < gEntryCount; ++i) {
        free(gEntries[i]->name);
        free(gEntries[i]);
    }
    free(gEntries);
    gEntries = nullptr;
    gEntryCount = 0;
}

NamedColor* FindByName(const char* name) {
    for (int i = 0; i < gEntryCount; ++i) {
        if (_stricmp(gEntries[i]->name, name) == 0) {
            return gEntries[i];
        }
    }
    return nullptr;
}

// Adds or changes an entry; the caller holds gRegistryLock.
void Register(const char* name, unsigned char red, unsigned char green, unsigned char blue) {
    NamedColor* entry = FindByName(name);
    if (entry == nullptr) {
        gEntries = static_cast<NamedColor**>(
            HRealloc(gEntries, sizeof(NamedColor*) * static_cast<size_t>(gEntryCount + 1)));
        entry = static_cast<NamedColor*>(HMalloc(sizeof(NamedColor)));
        entry->name = HString(name);
        gEntries[gEntryCount++] = entry;
    }
    entry->red = red;
    entry->green = green;
    entry->blue = blue;
}

void EnsureRegistry() {
    if (gReady.load(std::memory_order_acquire)) {
        return;
    }
    std::lock_guard<std::mutex> guard(gRegistryLock);
    if (gEntries == nullptr) {
        gEntries = static_cast<NamedColor**>(HMalloc(sizeof(NamedColor*)));
        gEntryCount = 0;
        for (const ColorRow& row : gDisplayColors.rows) {
            Register(row.name, row.red, row.green, row.blue);
        }
        _IMPAtExit(ReleaseRegistry, "base/dwxcore/dwxcolor", 94);
    }
    gReady.store(true, std::memory_order_release);
}

}  // namespace

using dwxcore::internal::ComponentOf;

DWXColor::DWXColor() : nAlpha(0), nRed(0), nGreen(0), nBlue(0) {}

DWXColor::DWXColor(int red, int green, int blue) {
    SetRGB(red, green, blue);
}

DWXColor::DWXColor(int alpha, int red, int green, int blue) {
    SetARGB(alpha, red, green, blue);
}

DWXColor::~DWXColor() {}

bool DWXColor::operator==(const DWXColor& other) const {
    return nAlpha == other.nAlpha && nRed == other.nRed && nGreen == other.nGreen &&
           nBlue == other.nBlue;
}

bool DWXColor::operator!=(const DWXColor& other) const {
    return !(*this == other);
}

void DWXColor::SetRGB(int red, int green, int blue) {
    SetARGB(255, red, green, blue);
}

void DWXColor::SetARGB(int alpha, int red, int green, int blue) {
    nAlpha = static_cast<unsigned char>(alpha);
    nRed = static_cast<unsigned char>(red);
    nGreen = static_cast<unsigned char>(green);
    nBlue = static_cast<unsigned char>(blue);
}

bool DWXColor::SetByName(const char* name) {
    if (name == nullptr) {
        return false;
    }
    EnsureRegistry();
    if (const NamedColor* entry = FindByName(name)) {
        SetRGB(entry->red, entry->green, entry->blue);
        return true;
    }

    // "(RGB:1 2 3)" as GetRGBName writes it, or "RGB:1 2 3"; the closing
    // parenthesis after the third number is ignored by the number scan.
    if (const char* rgb = strstr(name, "RGB:")) {
        char** words = Tokenize(rgb + 4);
        const bool found = CountStringList(words) >= 3;
        if (found) {
            SetRGB(ComponentOf(words[0]), ComponentOf(words[1]), ComponentOf(words[2]));
        }
        DestroyStringList(words);
        if (found) {
            return true;
        }
    }

    // The built-in names, so that both Grey and Gray are understood.
    for (const ColorRow& row : kBuiltinColors) {
        if (_stricmp(row.name, name) == 0) {
            SetRGB(row.red, row.green, row.blue);
            return true;
        }
    }
    return false;
}

DWXString DWXColor::GetName() const {
    EnsureRegistry();
    for (int i = 0; i < gEntryCount; ++i) {
        const NamedColor* entry = gEntries[i];
        if (entry->red == nRed && entry->green == nGreen && entry->blue == nBlue) {
            return DWXString(entry->name);
        }
    }
    return GetRGBName();
}

DWXString DWXColor::GetRGBName() const {
    return DWXFormat("(RGB:%d %d %d)", nRed, nGreen, nBlue);
}

void DWXColor::Dump(FILE* stream) const {
    if (!stream) {
        return;
    }
    fprintf(stream, "<DWXColor:%d,%d,%d>\n", nRed, nGreen, nBlue);
}

const char* DWXColor::GetClassName() const {
    return "DWXColor";
}

void AddNamedColor(const char* name, const DWXColor& color) {
    if (name == nullptr) {
        return;
    }
    EnsureRegistry();
    std::lock_guard<std::mutex> guard(gRegistryLock);
    Register(name, static_cast<unsigned char>(color.GetRed()),
             static_cast<unsigned char>(color.GetGreen()),
             static_cast<unsigned char>(color.GetBlue()));
}

char** GetNamedColors() {
    EnsureRegistry();
    std::lock_guard<std::mutex> guard(gRegistryLock);
    char** names =
        static_cast<char**>(HMalloc(sizeof(char*) * static_cast<size_t>(gEntryCount + 1)));
    for (int i = 0; i < gEntryCount; ++i) {
        names[i] = gEntries[i]->name;
    }
    names[gEntryCount] = nullptr;
    return names;
}
