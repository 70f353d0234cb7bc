// Colours: an alpha, red, green, blue value and the process-wide registry of
// named colours that turns colours into display names and names back into
// colours.
#pragma once

#include <dwxcore/dwxcore_export.h>
#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxstring.h>

#include <stdio.h>

// A colour of four bytes. Every int given to a constructor or setter is stored
// as its low 8 bits (300 becomes 44, -1 becomes 255). Colours made from red,
// green and blue alone have alpha 255; a default colour is all 0, alpha included.
class DWXCORE_API DWXColor : public DWXObject {
  public:
    DWXColor();
    DWXColor(int red, int green, int blue);
    DWXColor(int alpha, int red, int green, int blue);
    DWXColor(const DWXColor& other) = default;
    DWXColor& operator=(const DWXColor& other) = default;
    ~DWXColor() override;

    // Alpha takes part in the comparison: DWXColor() differs from DWXColor(0, 0, 0).
    bool operator==(const DWXColor& other) const;
    bool operator!=(const DWXColor& other) const;

    int GetAlpha() const { return nAlpha; }
    int GetRed() const { return nRed; }
    int GetGreen() const { return nGreen; }
    int GetBlue() const { return nBlue; }

    // Sets the components and alpha 255.
    void SetRGB(int red, int green, int blue);
    void SetARGB(int alpha, int red, int green, int blue);

    // Sets red, green and blue (and alpha 255) from, in this order: a registered
    // name, a text holding "RGB:" followed by at least three numbers, a built-in
    // colour name (Grey spellings). Names compare ignoring case. Returns false and
    // leaves the colour unchanged when none applies, and for a null name.
    bool SetByName(const char* name);

    // The first registered name with this colour's red, green and blue (alpha is
    // ignored), or GetRGBName when none has them.
    DWXString GetName() const;
    // "(RGB:red green blue)", which SetByName reads back.
    DWXString GetRGBName() const;

    // Writes "<DWXColor:red,green,blue>\n"; alpha is not shown.
    void Dump(FILE* stream) const override;
    const char* GetClassName() const override;

  private:
    unsigned char nAlpha;
    unsigned char nRed;
    unsigned char nGreen;
    unsigned char nBlue;
};

// Registers `name` for the colour's red, green and blue, or, when a name equal
// ignoring case is registered already, changes that entry's components (its
// stored name keeps its spelling). Alpha is ignored; a null name does nothing.
// Call it while no other thread uses colours: lookups read the registry unlocked.
DWXCORE_API void AddNamedColor(const char* name, const DWXColor& color);

// Every registered name in order of registration, followed by a null pointer.
// The array is new and the caller frees it with free(); the names are the
// registry's own, borrowed and valid until process exit: never change or free them.
DWXCORE_API char** GetNamedColors();
