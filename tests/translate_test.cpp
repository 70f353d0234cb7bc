#include <dwxcore/dwxtranslate.h>

#include <gtest/gtest.h>

namespace {

struct Rect {
    double x1, y1, x2, y2;
};

DWXTranslate Make(Rect src, Rect dest) {
    DWXTranslate map;
    map.SetSrcRect(src.x1, src.y1, src.x2, src.y2);
    map.SetDestRect(dest.x1, dest.y1, dest.x2, dest.y2);
    return map;
}

}  // namespace

// The corners map onto each other in order, whichever way round they are given,
// and every point comes back where it started.
TEST(Translate, MapsBothWaysIncludingFlippedAxes) {
    struct Row {
        Rect src, dest;
        double sx, sy;  // a source point
        double dx, dy;  // where it lands
    } rows[] = {
        {{0, 0, 10, 10}, {0, 0, 100, 50}, 5, 5, 50, 25},
        {{0, 0, 10, 10}, {0, 0, 100, 50}, 10, 10, 100, 50},
        {{0, 0, 10, 10}, {0, 100, 100, 0}, 0, 0, 0, 100},
        {{0, 0, 10, 10}, {0, 100, 100, 0}, 10, 10, 100, 0},
        {{10, 10, 0, 0}, {0, 0, 100, 100}, 10, 2, 0, 80},
        {{10, 10, 0, 0}, {100, 100, 0, 0}, 2.5, 7.5, 25, 75},
        {{2, 3, 4, 7}, {10, 20, 30, 60}, 3, 5, 20, 40},
        {{2, 3, 4, 7}, {10, 20, 30, 60}, -2, -1, -30, -20},
        {{-5, -5, 5, 5}, {0, 0, 1, 1}, 0, 0, 0.5, 0.5},
    };
    for (const Row& row : rows) {
        const DWXTranslate map = Make(row.src, row.dest);
        EXPECT_DOUBLE_EQ(row.dx, map.Src2DestX(row.sx));
        EXPECT_DOUBLE_EQ(row.dy, map.Src2DestY(row.sy));
        EXPECT_DOUBLE_EQ(row.sx, map.Dest2SrcX(row.dx));
        EXPECT_DOUBLE_EQ(row.sy, map.Dest2SrcY(row.dy));
        double x = row.sx, y = row.sy;
        map.Src2Dest(&x, &y);
        EXPECT_DOUBLE_EQ(row.dx, x);
        EXPECT_DOUBLE_EQ(row.dy, y);
        map.Dest2Src(&x, &y);
        EXPECT_DOUBLE_EQ(row.sx, x);
        EXPECT_DOUBLE_EQ(row.sy, y);
    }
}

TEST(Translate, FreshMapSendsEverythingToZero) {
    DWXTranslate map;
    EXPECT_EQ(0.0, map.Src2DestX(7));
    EXPECT_EQ(0.0, map.Src2DestY(-3));
    EXPECT_EQ(0.0, map.Dest2SrcX(7));
    EXPECT_EQ(0.0, map.Dest2SrcY(-3));
    double x1 = 1, y1 = 1, x2 = 1, y2 = 1;
    map.GetDestRect(&x1, &y1, &x2, &y2);
    EXPECT_EQ(0.0, x1 + y1 + x2 + y2);
}

// The map follows each rectangle as it is set, in either order.
TEST(Translate, EitherRectangleFirst) {
    DWXTranslate map;
    map.SetDestRect(0, 0, 100, 50);
    EXPECT_EQ(0.0, map.Src2DestX(5));
    map.SetSrcRect(0, 0, 10, 10);
    EXPECT_DOUBLE_EQ(50, map.Src2DestX(5));
    map.SetDestRect(100, 100, 200, 200);
    EXPECT_DOUBLE_EQ(150, map.Src2DestX(5));
    EXPECT_DOUBLE_EQ(150, map.Src2DestY(5));
}

TEST(Translate, DegenerateRectangles) {
    // A source of zero width or height keeps the previous map on both axes,
    // while its corners are stored.
    const Rect degenerate[] = {{5, 0, 5, 10}, {0, 5, 20, 5}, {1, 1, 1, 1}};
    for (const Rect& src : degenerate) {
        DWXTranslate map = Make({0, 0, 10, 10}, {0, 0, 100, 50});
        map.SetSrcRect(src.x1, src.y1, src.x2, src.y2);
        EXPECT_DOUBLE_EQ(50, map.Src2DestX(5));
        EXPECT_DOUBLE_EQ(25, map.Src2DestY(5));
        double x1, y1, x2, y2;
        map.GetSrcRect(&x1, &y1, &x2, &y2);
        EXPECT_EQ(src.x1, x1);
        EXPECT_EQ(src.y1, y1);
        EXPECT_EQ(src.x2, x2);
        EXPECT_EQ(src.y2, y2);
    }

    // A destination point squeezes every source point onto it; the way back is 0.
    const DWXTranslate map = Make({0, 0, 10, 10}, {3, 3, 3, 3});
    double x = 8, y = -2;
    map.Src2Dest(&x, &y);
    EXPECT_EQ(3.0, x);
    EXPECT_EQ(3.0, y);
    map.Dest2Src(&x, &y);
    EXPECT_EQ(0.0, x);
    EXPECT_EQ(0.0, y);
    // Only the flat axis loses its inverse.
    const DWXTranslate flat = Make({0, 0, 10, 10}, {0, 7, 100, 7});
    EXPECT_DOUBLE_EQ(5, flat.Dest2SrcX(50));
    EXPECT_EQ(0.0, flat.Dest2SrcY(7));
}

TEST(Translate, NullPointersAreSkipped) {
    const DWXTranslate map = Make({0, 0, 10, 10}, {0, 0, 100, 50});
    double x = 5, y = 5;
    map.Src2Dest(&x, nullptr);
    EXPECT_DOUBLE_EQ(50, x);
    map.Src2Dest(nullptr, &y);
    EXPECT_DOUBLE_EQ(25, y);
    map.Dest2Src(nullptr, &y);
    EXPECT_DOUBLE_EQ(5, y);
    map.Dest2Src(&x, nullptr);
    EXPECT_DOUBLE_EQ(5, x);
    map.Src2Dest(nullptr, nullptr);
    map.Dest2Src(nullptr, nullptr);

    double y1 = -1, x2 = -1;
    map.GetDestRect(nullptr, &y1, &x2, nullptr);
    EXPECT_EQ(0.0, y1);
    EXPECT_EQ(100.0, x2);
    map.GetSrcRect(nullptr, nullptr, nullptr, nullptr);
}

TEST(Translate, CopiesCarryTheMap) {
    const DWXTranslate original = Make({0, 0, 10, 10}, {0, 100, 100, 0});
    DWXTranslate assigned;
    assigned = original;
    const DWXTranslate copied(original);
    const DWXTranslate* copies[] = {&assigned, &copied};
    for (const DWXTranslate* map : copies) {
        EXPECT_DOUBLE_EQ(100, map->Src2DestY(0));
        double x2, y2;
        map->GetSrcRect(nullptr, nullptr, &x2, &y2);
        EXPECT_EQ(10.0, x2);
        EXPECT_EQ(10.0, y2);
        map->GetDestRect(nullptr, nullptr, &x2, &y2);
        EXPECT_EQ(100.0, x2);
        EXPECT_EQ(0.0, y2);
    }
    // A degenerate source after the copy still finds the copied map in place.
    assigned.SetSrcRect(4, 4, 4, 4);
    EXPECT_DOUBLE_EQ(50, assigned.Src2DestX(5));
}
