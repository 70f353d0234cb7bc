// A linear mapping of coordinates between two axis-aligned rectangles.
#pragma once

#include <dwxcore/dwxcore_export.h>

// Maps a source rectangle onto a destination rectangle, each axis on its own:
// destination = source * scale + offset. The first corner of the source maps
// to the first corner of the destination and the second to the second, so
// corners given in opposite orders on an axis flip that axis.
class DWXCORE_API DWXTranslate {
  public:
    // Both rectangles and the map are zero: every point maps to 0 both ways.
    DWXTranslate();
    DWXTranslate(const DWXTranslate& other) = default;
    DWXTranslate& operator=(const DWXTranslate& other) = default;

    // Store the corners and recompute the map. A source with equal x or equal
    // y corners keeps the map that was in force; a destination of zero width
    // or height gives a scale of 0 on that axis.
    void SetSrcRect(double x1, double y1, double x2, double y2);
    void SetDestRect(double x1, double y1, double x2, double y2);
    // Write the stored corners through every pointer that is not null.
    void GetSrcRect(double* x1, double* y1, double* x2, double* y2) const;
    void GetDestRect(double* x1, double* y1, double* x2, double* y2) const;

    // Convert in place; a null pointer leaves that axis alone.
    void Src2Dest(double* x, double* y) const;
    void Dest2Src(double* x, double* y) const;

    double Src2DestX(double x) const;
    double Src2DestY(double y) const;
    // The inverse map; 0.0 when the axis's scale is 0.
    double Dest2SrcX(double x) const;
    double Dest2SrcY(double y) const;

  private:
    void CalculateTransform();

    double dScaleX;
    double dOffsetX;
    double dScaleY;
    double dOffsetY;
    double dSrcX1;
    double dSrcY1;
    double dSrcX2;
    double dSrcY2;
    double dDestX1;
    double dDestY1;
    double dDestX2;
    double dDestY2;
};
