#include <dwxcore/dwxtranslate.h>

#include <gtest/gtest.h>

// Corners map onto each other in order, whichever way round they are given
// and whichever rectangle is set first, and every point comes back.
TEST(Translate, MapsBothWaysIncludingFlippedAxes) {
    struct Row {
        double src[4], dest[4];
        double sx, sy, dx, dy;  // a source point and where it lands
    } rows[] = {
        {{0, 0, 10, 10}, {0, 0, 100, 50}, 5, 5, 50, 25},
        {{0, 0, 10, 10}, {0, 100, 100, 0}, 0, 10, 0, 0},
        {{10, 10, 0, 0}, {0, 0, 100, 100}, 10, 2, 0, 80},
        {{2, 3, 4, 7}, {10, 20, 30, 60}, -2, -1, -30, -20},
    };
    for (const Row& row : rows) {
        DWXTranslate map, reversed;
        map.SetSrcRect(row.src[0], row.src[1], row.src[2], row.src[3]);
        map.SetDestRect(row.dest[0], row.dest[1], row.dest[2], row.dest[3]);
        reversed.SetDestRect(row.dest[0], row.dest[1], row.dest[2], row.dest[3]);
        reversed.SetSrcRect(row.src[0], row.src[1], row.src[2], row.src[3]);
        double x = row.sx, y = row.sy;
        map.Src2Dest(&x, &y);
        EXPECT_TRUE(x == row.dx && y == row.dy && reversed.Src2DestX(row.sx) == x &&
                    reversed.Src2DestY(row.sy) == y);
        map.Dest2Src(&x, &y);
        EXPECT_TRUE(x == row.sx && y == row.sy) << x << " " << y;
    }
}

// A map never set gives 0 both ways; a flat source keeps the previous map but
// stores its corners; a destination point squeezes every source point onto
// it, and the way back gives 0. Null pointers are skipped.
TEST(Translate, DegenerateMapsAndNullPointers) {
    DWXTranslate map;
    EXPECT_EQ(0.0, map.Src2DestX(7) + map.Src2DestY(7) + map.Dest2SrcX(7) + map.Dest2SrcY(7));
    map.SetSrcRect(0, 0, 10, 10);
    map.SetDestRect(0, 0, 100, 50);
    map.SetSrcRect(5, 0, 5, 10);
    map.SetSrcRect(0, 5, 20, 5);
    double x = 5, y = 5, x1 = -1, y1 = -1, x2 = -1, y2 = -1;
    map.GetSrcRect(&x1, &y1, &x2, &y2);
    map.Src2Dest(&x, nullptr);
    map.Dest2Src(nullptr, &y);
    EXPECT_TRUE(x1 == 0 && y1 == 5 && x2 == 20 && y2 == 5 && map.Src2DestY(5) == 25);
    EXPECT_TRUE(x == 50.0 && y == 1.0);  // y went back alone: 5 / 5

    map.SetSrcRect(0, 0, 10, 10);
    map.SetDestRect(3, 3, 3, 3);
    map.GetDestRect(nullptr, &y1, &x2, nullptr);
    EXPECT_TRUE(map.Src2DestX(7) == 3 && map.Src2DestY(-1) == 3 && map.Dest2SrcX(3) == 0 &&
                map.Dest2SrcY(3) == 0 && y1 == 3 && x2 == 3);
}
