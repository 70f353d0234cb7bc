#include <dwxcore/dwxtranslate.h>

#include <gtest/gtest.h>

namespace {

DWXTranslate Make(const double (&src)[4], const double (&dest)[4]) {
    DWXTranslate map;
    map.SetSrcRect(src[0], src[1], src[2], src[3]);
    map.SetDestRect(dest[0], dest[1], dest[2], dest[3]);
    return map;
}

}  // namespace

// Corners map onto each other in order, whichever way round they are given,
// and every point comes back where it started.
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
        const DWXTranslate map = Make(row.src, row.dest);
        EXPECT_DOUBLE_EQ(row.dx, map.Src2DestX(row.sx));
        EXPECT_DOUBLE_EQ(row.dy, map.Src2DestY(row.sy));
        double x = row.sx, y = row.sy;
        map.Src2Dest(&x, &y);
        EXPECT_DOUBLE_EQ(row.dx, x);
        EXPECT_DOUBLE_EQ(row.dy, y);
        map.Dest2Src(&x, &y);
        EXPECT_DOUBLE_EQ(row.sx, x);
        EXPECT_DOUBLE_EQ(row.sy, y);
        EXPECT_DOUBLE_EQ(row.sx, map.Dest2SrcX(row.dx));
    }
    // Setting the destination first gives the same map.
    DWXTranslate map;
    map.SetDestRect(0, 0, 100, 50);
    map.SetSrcRect(0, 0, 10, 10);
    EXPECT_DOUBLE_EQ(25, map.Src2DestY(5));
}

TEST(Translate, ZeroAndDegenerateMaps) {
    DWXTranslate fresh;
    EXPECT_EQ(0.0,
              fresh.Src2DestX(7) + fresh.Src2DestY(7) + fresh.Dest2SrcX(7) + fresh.Dest2SrcY(7));

    // A flat source keeps the previous map on both axes but stores its corners.
    const double flat[][4] = {{5, 0, 5, 10}, {0, 5, 20, 5}};
    for (const auto& src : flat) {
        DWXTranslate map = Make({0, 0, 10, 10}, {0, 0, 100, 50});
        map.SetSrcRect(src[0], src[1], src[2], src[3]);
        EXPECT_DOUBLE_EQ(50, map.Src2DestX(5));
        EXPECT_DOUBLE_EQ(25, map.Src2DestY(5));
        double x1, y1, x2, y2;
        map.GetSrcRect(&x1, &y1, &x2, &y2);
        EXPECT_TRUE(x1 == src[0] && y1 == src[1] && x2 == src[2] && y2 == src[3]);
    }

    // A destination point squeezes every source point onto it; the way back is 0.
    const DWXTranslate point = Make({0, 0, 10, 10}, {3, 3, 3, 3});
    double x = 8, y = -2;
    point.Src2Dest(&x, &y);
    EXPECT_TRUE(x == 3.0 && y == 3.0);
    point.Dest2Src(&x, &y);
    EXPECT_TRUE(x == 0.0 && y == 0.0);
}

TEST(Translate, NullPointersAreSkipped) {
    const DWXTranslate map = Make({0, 0, 10, 10}, {0, 0, 100, 50});
    double x = 5, y = 5;
    map.Src2Dest(&x, nullptr);
    map.Dest2Src(nullptr, &y);
    EXPECT_TRUE(x == 50.0 && y == 1.0);  // y went back alone: 5 / 5
    map.Src2Dest(nullptr, nullptr);
    map.Dest2Src(nullptr, nullptr);
    double y1 = -1, x2 = -1;
    map.GetDestRect(nullptr, &y1, &x2, nullptr);
    EXPECT_TRUE(y1 == 0.0 && x2 == 100.0);
    map.GetSrcRect(nullptr, nullptr, nullptr, nullptr);
}
