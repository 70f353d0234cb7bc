// The fast paths of the busiest operations (a character appended to a string,
// a member added to an array and walked, a difference of dates) must give
// exactly what the general code gives, from every state an object can be in.
#include "container_test_util.h"
#include "report_capture.h"

#include <dwxcore/dwxdate.h>
#include <dwxcore/dwxobject.h>
#include <dwxcore/dwxstring.h>
#include <services/utilhub.h>

#include <gtest/gtest.h>

#include <algorithm>
#include <climits>
#include <random>
#include <string>
#include <vector>

namespace {

class Item : public DWXObject {
  public:
    const char* GetClassName() const override { return "Item"; }
};

TEST(HotPaths, CharAppendsFromEveryKindOfString) {
    DWXString nil, exact("xy"), truncated("abcdef"), formatted = DWXFormat("%d", 42);
    DWXString nuls("a\0b", 3);
    truncated.SetLength(2);  // a block with room to spare
    struct {
        DWXString* s;
        std::string text;
    } cases[] = {{&nil, ""},
                 {&exact, "xy"},
                 {&truncated, "ab"},
                 {&formatted, "42"},
                 {&nuls, std::string("a\0b", 3)}};
    for (auto& c : cases) {
        for (int i = 0; i < 300; ++i) {
            char ch = i % 7 == 0 ? '\0' : static_cast<char>('a' + i % 26);
            *c.s += ch;
            c.text += ch;
            const char* data = *c.s;
            ASSERT_EQ(std::string(data, static_cast<size_t>(c.s->GetLength())), c.text);
            ASSERT_EQ(data[c.s->GetLength()], '\0') << "after " << i + 1 << " appends";
        }
    }
}

// Random adds, removals, stores and inserts against a plain list of slots: the
// members, their slots and the walk must agree after every step, so an Add
// that skipped the reuse of trailing empty slots would show.
TEST(HotPaths, ArrayAddsAgreeWithASlotModel) {
    std::vector<Item> items(24);
    std::mt19937 random(917);
    SlotView<DWXArray> array;
    std::vector<DWXObject*> slots;
    for (int step = 0; step < 2000; ++step) {
        DWXObject* item = random() % 5 ? &items[random() % items.size()] : nullptr;
        size_t index = random() % (slots.size() + 4);  // mostly near the top
        unsigned operation = random() % 6;
        if (operation < 3) {
            array.Add(item);
            while (item && !slots.empty() && !slots.back())
                slots.pop_back();  // Add reuses trailing empty slots
            if (item)
                slots.push_back(item);
        } else if (operation == 3) {
            if (array.Remove(item)) {
                *std::find(slots.begin(), slots.end(), item) = nullptr;
            }
        } else if (operation == 4) {
            array.SetAt(static_cast<int>(index), item);
            slots.resize(std::max(slots.size(), index + 1));
            slots[index] = item;
        } else {
            array.InsertAt(static_cast<int>(index), item);
            slots.resize(std::max(slots.size(), index));
            slots.insert(slots.begin() + static_cast<long>(index), item);
        }
        std::vector<DWXObject*> members;
        for (size_t i = 0; i < slots.size() + 2; ++i) {
            DWXObject* slot = i < slots.size() ? slots[i] : nullptr;
            ASSERT_EQ(array[static_cast<int>(i)], slot) << "slot " << i << " at step " << step;
            if (slot)
                members.push_back(slot);
        }
        ASSERT_EQ(Walk(array), members) << "step " << step;
        ASSERT_EQ(array.GetCount(), static_cast<int>(members.size()));
    }
}

// The day count divides years by 4, 100 and 400, rounding down also below
// year 1: every 400 years hold 146097 days, wherever they start.
TEST(HotPaths, DifferencesRepeatEvery400YearsAcrossTheIntRange) {
    ReportCapture quiet;  // years below 1
    for (int year : {INT_MIN, -1000001, -801, -400, -399, -1, 0, 1, 2, 100, 1600, 1700, 2000, 2001,
                     2100, 1000000, INT_MAX - 400}) {
        for (int month : {1, 2, 3, 12}) {
            for (int day : {-40, 0, 1, 28, 29, 31, 40}) {
                DWXDate early(month, day, year), late(month, day, year + 400);
                ASSERT_EQ(late.GetDifference(early), 146097) << month << "/" << day << "/" << year;
            }
        }
        DWXDate march(3, 1, year), february(2, 28, year);
        EXPECT_EQ(march.GetDifference(february), 1 + DWXDate::LeapYear(year)) << year;
    }
}

}  // namespace
