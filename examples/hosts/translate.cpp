// DWXTranslate: maps points between a source and a destination rectangle.
#include <dwxcore/dwxtranslate.h>

#include <stdio.h>

int main() {
    // A 4000x3000 photo shown in a 800x600 window whose y axis points up.
    DWXTranslate view;
    view.SetSrcRect(0, 0, 4000, 3000);
    view.SetDestRect(0, 600, 800, 0);
    double x = 2000;
    double y = 750;
    view.Src2Dest(&x, &y);
    printf("photo (2000, 750) is window (%g, %g)\n", x, y);
    printf("window x 400 is photo x %g\n", view.Dest2SrcX(400));
    return 0;
}
