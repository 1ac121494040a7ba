#include "FormatsSupport.h"
#include "formats/settings/CFBinaryPlistFindTrailer.h"
#include "formats/settings/TGRTSettingsHeaderReader.h"
#include "platform/base/bytes/SwapData.h"
#include "support/AudioFixtures.h"

#include <algorithm>
#include <array>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using Header = std::array<std::uint8_t, TGRTSettingsHeaderReader::kHeaderLength>;

Header header(std::uint8_t flag, const char* manufacturer) {
    Header bytes{};
    for (std::size_t i = 0; i < bytes.size(); ++i) bytes[i] = static_cast<std::uint8_t>(0x10 + i);
    bytes[6] = flag;
    bytes[7] = 0xFE;
    std::copy_n(manufacturer, 4, bytes.begin() + 12);
    return bytes;
}

TEST(SettingsHeader, SwapsInTwoOfFourCases) {
    struct {
        const char* manufacturer;
        std::uint8_t flag;
        bool swaps;
    } const cases[] = {{"CLEM", 1, false}, {"MELC", 9, false}, {"CLEM", 0, true}, {"MELC", 0, true},
                       {"abcd", 0, false}, {"abcd", 1, true},  {"clem", 1, true}};
    for (const auto& c : cases) {
        const Header source = header(c.flag, c.manufacturer);
        Header result{};
        EXPECT_EQ(TGRTSettingsHeaderReader::_swapHeaderFromSrc(source, result), c.swaps) << c.manufacturer;
        Header expected = source;
        if (c.swaps) {
            for (const auto& [first, last] : {std::pair{0, 4}, {4, 6}, {8, 12}, {12, 16}, {16, 20}, {20, 24}})
                std::reverse(expected.begin() + first, expected.begin() + last);
            expected[6] = 0;
        }
        EXPECT_EQ(result, expected) << c.manufacturer << " " << int{c.flag};
    }
}

TEST(SettingsHeader, ReadsTheFieldsOfAWholeOrShortFile) {
    const test::TemporaryFolder folder;
    const Header bytes = header(1, "CLEM");
    const std::string whole(bytes.begin(), bytes.end());
    const auto read = [&](const std::string& contents) {
        return TGRTSettingsHeaderReader::settingInfoForURL(test::urlOf(folder.write("a.pst", contents)));
    };
    auto info = read(whole + "the settings");
    EXPECT_EQ(info->manuID(), 0x4D454C43U);
    EXPECT_EQ(info->productID(), 0x23222120U);
    EXPECT_EQ(info->plugInID(), 0x27262524U);
    EXPECT_EQ(info->plugInSubID(), 0xFFFFFFFEU) << "the sub ID is signed";
    info = read(whole.substr(0, 18));
    EXPECT_EQ(info->manuID(), 0x4D454C43U);
    EXPECT_EQ(info->productID(), 0x00002120U);
    info = read(std::string(10, '\0'));
    EXPECT_EQ(info->manuID() | info->productID() | info->plugInID() | info->plugInSubID(), 0U);
    Error error;
    EXPECT_EQ(TGRTSettingsHeaderReader::settingInfoForURL(test::urlOf(folder.path("none")), &error), nullptr);
    EXPECT_THAT(error.message(), testing::HasSubstr(folder.path("none")));
    EXPECT_EQ(TGRTSettingsHeaderReader::settingInfoForURL(test::urlOf(folder.path())), nullptr);
    EXPECT_EQ(TGRTSettingsHeaderReader::settingInfoForURL(std::nullopt), nullptr);
}

TEST(SwapData, StopsWhereTheRecordOrTheTableEnds) {
    const std::vector<std::uint8_t> source = {1, 2, 3, 4, 5, 6, 7};
    struct {
        std::vector<int> fields;
        std::vector<std::uint8_t> result;
    } const cases[] = {{{2, -1, 4}, {2, 1, 3, 7, 6, 5, 4}},
                       {{2, 0, 2}, {2, 1, 3, 4, 5, 6, 7}},
                       {{4, 4}, {4, 3, 2, 1, 5, 6, 7}},
                       {{-8, 2}, source},
                       {{}, source},
                       {{7}, {7, 6, 5, 4, 3, 2, 1}}};
    for (const auto& c : cases) {
        std::vector<std::uint8_t> result(source.size());
        SwapData(source, result, c.fields);
        EXPECT_EQ(result, c.result);
        std::vector<std::uint8_t> inPlace = source;
        SwapData(inPlace, inPlace, c.fields);
        EXPECT_EQ(inPlace, c.result);
    }
}

/// A trailer of those fields.
struct Trailer {
    std::string unused = std::string(5, '\0');
    std::uint64_t offsetWidth = 1;
    std::uint64_t referenceWidth = 1;
    std::uint64_t count = 3;
    std::uint64_t top = 0;
    std::uint64_t table = 20;

    std::string bytes() const {
        return unused + "s" + test::big(offsetWidth, 1) + test::big(referenceWidth, 1) + test::big(count, 8) +
               test::big(top, 8) + test::big(table, 8);
    }
};

std::optional<std::uint64_t> findIn(const std::string& bytes) {
    const std::vector<std::uint8_t> exact(bytes.begin(), bytes.end());
    std::uint64_t position = 0;
    const bool found = CFBinaryPlistFindTrailer(exact.data(), exact.size(), &position);
    return found ? std::optional(position) : std::nullopt;
}

TEST(TrailerSearch, PassesOverWhatCannotBeOne) {
    constexpr std::uint64_t most = ~std::uint64_t{0};
    struct {
        const char* what;
        Trailer trailer;
        bool isOne;
    } const cases[] = {
        {"good", {}, true},
        {"fifth unused byte", {.unused = std::string("\0\0\0\0\1", 5)}, false},
        {"first unused byte", {.unused = std::string("\1\0\0\0\0", 5)}, false},
        {"no offset width", {.offsetWidth = 0}, false},
        {"no reference width", {.referenceWidth = 0}, false},
        {"wide widths", {.offsetWidth = 255, .referenceWidth = 9}, true},
        {"no objects", {.count = 0}, false},
        {"objects over 2^63", {.referenceWidth = 8, .count = std::uint64_t{1} << 63U}, false},
        {"table would overflow", {.offsetWidth = 3, .referenceWidth = 8, .count = most / 3 + 1}, false},
        {"table ends behind 2^64", {.offsetWidth = 4, .referenceWidth = 8, .count = most / 4}, false},
        {"most objects", {.referenceWidth = 8, .count = (std::uint64_t{1} << 63U) - 1}, true},
        {"256 objects in one byte", {.count = 256}, false},
        {"255 objects in one byte", {.count = 255}, true},
        {"top at the count", {.top = 3}, false},
        {"top below the count", {.top = 2}, true},
        {"table in the magic", {.table = 8}, false},
        {"first table", {.table = 9}, true},
        {"table at the end", {.table = 60 - 32}, false},
        {"last table", {.table = 60 - 33}, true},
        {"table over 2^63", {.offsetWidth = 8, .table = std::uint64_t{1} << 63U}, false},
    };
    for (const auto& c : cases) {
        const std::string bytes = "bplist00" + std::string(20, 'x') + c.trailer.bytes();
        ASSERT_EQ(bytes.size(), 60U);
        EXPECT_EQ(findIn(bytes), c.isOne ? std::optional<std::uint64_t>(28) : std::nullopt) << c.what;
    }
    // An offset table behind byte 255 needs two bytes an offset.
    const std::string longList = "bplist00" + std::string(300, 'x');
    EXPECT_FALSE(findIn(longList + Trailer{.table = 256}.bytes()));
    EXPECT_EQ(findIn(longList + Trailer{.offsetWidth = 2, .table = 256}.bytes()), 308U);
}

TEST(TrailerSearch, TakesTheFirstThatCouldBeOne) {
    const std::string good = Trailer{}.bytes();
    const std::string nearMiss = Trailer{.top = 3}.bytes();
    EXPECT_EQ(findIn("bplist00" + nearMiss + "yy" + good + good), 42U);
    EXPECT_EQ(findIn("bplist00" + good + std::string(100, '\0')), 8U);
    const std::string cut = "bplist00" + std::string(20, 'x') + good.substr(0, 31);
    EXPECT_FALSE(findIn(cut)) << "a trailer lies wholly within the data";
    EXPECT_FALSE(findIn("bplist01" + good));
    EXPECT_FALSE(findIn("bplist00"));
    EXPECT_FALSE(findIn(""));
    EXPECT_FALSE(CFBinaryPlistFindTrailer(nullptr, 100, nullptr));
}

}  // namespace
}  // namespace qvct
