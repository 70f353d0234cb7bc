#include <dwxcore/dwxtranslate.h>

#include <tuple>

namespace {

void Put(double* target, double value) {
    if (target != nullptr) {
        *target = value;
    }
}

}  // namespace

DWXTranslate::DWXTranslate()
    : dScaleX(0.0),
      dOffsetX(0.0),
      dScaleY(0.0),
      dOffsetY(0.0),
      dSrcX1(0.0),
      dSrcY1(0.0),
      dSrcX2(0.0),
      dSrcY2(0.0),
      dDestX1(0.0),
      dDestY1(0.0),
      dDestX2(0.0),
      dDestY2(0.0) {}

void DWXTranslate::SetSrcRect(double x1, double y1, double x2, double y2) {
    std::tie(dSrcX1, dSrcY1, dSrcX2, dSrcY2) = std::tie(x1, y1, x2, y2);
    CalculateTransform();
}

void DWXTranslate::SetDestRect(double x1, double y1, double x2, double y2) {
    std::tie(dDestX1, dDestY1, dDestX2, dDestY2) = std::tie(x1, y1, x2, y2);
    CalculateTransform();
}

void DWXTranslate::GetSrcRect(double* x1, double* y1, double* x2, double* y2) const {
    Put(x1, dSrcX1);
    Put(y1, dSrcY1);
    Put(x2, dSrcX2);
    Put(y2, dSrcY2);
}

void DWXTranslate::GetDestRect(double* x1, double* y1, double* x2, double* y2) const {
    Put(x1, dDestX1);
    Put(y1, dDestY1);
    Put(x2, dDestX2);
    Put(y2, dDestY2);
}

void DWXTranslate::Src2Dest(double* x, double* y) const {
    if (x != nullptr) {
        *x = Src2DestX(*x);
    }
    if (y != nullptr) {
        *y = Src2DestY(*y);
    }
}

void DWXTranslate::Dest2Src(double* x, double* y) const {
    if (x != nullptr) {
        *x = Dest2SrcX(*x);
    }
    if (y != nullptr) {
        *y = Dest2SrcY(*y);
    }
}

double DWXTranslate::Src2DestX(double x) const {
    return x * dScaleX + dOffsetX;
}

double DWXTranslate::Src2DestY(double y) const {
    return y * dScaleY + dOffsetY;
}

double DWXTranslate::Dest2SrcX(double x) const {
    return dScaleX == 0.0 ? 0.0 : (x - dOffsetX) / dScaleX;
}

double DWXTranslate::Dest2SrcY(double y) const {
    return dScaleY == 0.0 ? 0.0 : (y - dOffsetY) / dScaleY;
}

// A source of zero width or height has no map; the previous one stays on
// both axes, so a host that sets a degenerate rectangle for a moment keeps
// converting as before.
void DWXTranslate::CalculateTransform() {
    if (dSrcX1 == dSrcX2 || dSrcY1 == dSrcY2) {
        return;
    }
    dScaleX = (dDestX2 - dDestX1) / (dSrcX2 - dSrcX1);
    dScaleY = (dDestY2 - dDestY1) / (dSrcY2 - dSrcY1);
    dOffsetX = dDestX1 - dScaleX * dSrcX1;
    dOffsetY = dDestY1 - dScaleY * dSrcY1;
}
