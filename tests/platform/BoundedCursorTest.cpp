#include "platform/files/reading/BoundedCursor.h"

#include <algorithm>
#include <functional>
#include <utility>

#include <gtest/gtest.h>

namespace qvct {
namespace {

/// Sevens; those behind the first 5000 cannot be read.
class ShrunkenReader : public RandomAccessReader {
  public:
    std::uint64_t size() const override { return 6000; }
    bool read(std::uint64_t offset, std::span<std::uint8_t> into) const override {
        std::fill(into.begin(), into.end(), std::uint8_t{7});
        return offset + into.size() <= 5000;
    }
};

TEST(BoundedCursor, FailsForGoodAtWhatDoesNotFit) {
    const ShrunkenReader reader;
    ReadWindow window(reader);
    const std::pair<const char*, std::function<bool(BoundedCursor&)>> reads[] = {
        {"number", [](BoundedCursor& cursor) { return cursor.u64() == 0; }},
        {"skip", [](BoundedCursor& cursor) { return cursor.skip(8), true; }},
        {"bytes", [](BoundedCursor& cursor) { return cursor.bytes(8).empty(); }},
        {"text", [](BoundedCursor& cursor) { return cursor.text(8).empty(); }},
        {"part", [](BoundedCursor& cursor) { return cursor.part(8).failed(); }},
    };
    const std::pair<std::uint64_t, std::uint64_t> places[] = {{100, 7}, {5994, 100}};  // offset, size
    for (const auto& [name, read] : reads) {
        for (const auto& [offset, size] : places) {
            BoundedCursor cursor(window, ByteOrder::big, offset, size);
            EXPECT_TRUE(read(cursor)) << name;
            EXPECT_TRUE(cursor.failed()) << name;
            EXPECT_EQ(cursor.remaining(), 0U) << name;
            EXPECT_EQ(cursor.u8(), 0U) << name;
        }
    }
    BoundedCursor cursor(window, ByteOrder::big, 4990, 1000);
    EXPECT_TRUE(cursor.bytes(20).empty());
    EXPECT_TRUE(cursor.failed());
}

}  // namespace
}  // namespace qvct
