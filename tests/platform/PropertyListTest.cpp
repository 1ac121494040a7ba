#include "platform/data/Json.h"
#include "platform/data/PropertyList.h"
#include "platform/data/PropertyListFile.h"
#include "platform/data/propertylist/PropertyListPlace.h"
#include "support/AudioFixtures.h"
#include "support/ProcessorClock.h"
#include "support/TemporaryFolder.h"
#include "support/Texts.h"

#include <chrono>
#include <limits>

#include <fmt/format.h>
#include <gtest/gtest.h>

namespace qvct {
namespace {

using Dictionary = PropertyList::Dictionary;
using test::big;
using test::repeated;

/// One value of every kind, with the numbers at which narrower types break.
PropertyList everyKind() {
    return Dictionary{
        {"zebra", "first, though not by alphabet"},
        {"umlaut \xc3\xa9 & <tag>", "\xe9\x9f\xb3 \xf0\x9f\xa5\x81 & < > \" '"},
        {"empty", Dictionary{}},
        {"array", PropertyList::Array{1, "two", PropertyList::Array{}, true, false}},
        {"most negative", std::numeric_limits<std::int64_t>::min()},
        {"minus one", -1},
        {"most positive", std::numeric_limits<std::int64_t>::max()},
        {"unsigned", std::numeric_limits<std::uint64_t>::max()},
        {"half", 0.5},
        {"tiny", 1e-300},
        {"distant past", PropertyList::Date{-63114076800.0}},
        {"distant future", PropertyList::Date{63113904000.0}},
        {"data", PropertyList::Data{0, 255, 13, 10, 0}},
        {"uid", PropertyList::Uid{70000}},
    };
}

std::vector<std::string> keys(const PropertyList& value) {
    std::vector<std::string> result;
    for (const auto& entry : *value.dictionary()) result.push_back(entry.key);
    return result;
}

TEST(PropertyList, EveryValueAndTheOrderSurviveBothEncodings) {
    const PropertyList original = everyKind();
    for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
        const test::TemporaryFolder folder;
        const std::string path = folder.path("all.plist");
        Error error;
        ASSERT_TRUE(writePropertyListFile(original, path, format, &error)) << error.message();
        const auto read = readPropertyListFile(path, &error);
        ASSERT_TRUE(read) << error.message();
        EXPECT_EQ(keys(*read), keys(original));
        for (const auto& entry : *original.dictionary()) {
            const PropertyList* value = read->dictionary()->value(entry.key);
            ASSERT_NE(value, nullptr) << entry.key;
            EXPECT_EQ(*value, entry.value) << entry.key;
        }
    }
}

TEST(PropertyList, XmlIsWhatThePlatformsOwnReadersExpect) {
    const std::string xml =
        serializePropertyList(Dictionary{{"a", Dictionary{{"b", 1}}}}, PropertyListFormat::xml);
    EXPECT_TRUE(xml.starts_with("<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<!DOCTYPE plist PUBLIC "))
        << xml;
    EXPECT_NE(xml.find("\n\t<key>a</key>\n\t<dict>\n\t\t<key>b</key>\n"), std::string::npos) << xml;
    const struct {
        PropertyList value;
        const char* xml;
    } cases[] = {
        {"a\r\n<&>\"'", "<string>a&#13;\n&lt;&amp;&gt;\"'</string>\n"},
        {PropertyList::Date{-63113904000.0}, "<date>0001-01-01T00:00:00Z</date>\n"},
        {PropertyList::Date{86399.9}, "<date>2001-01-01T23:59:59Z</date>\n"},
        {-0.0, "<real>-0.0</real>\n"},
        {0.1, "<real>0.10000000000000001</real>\n"},
        {std::numeric_limits<double>::quiet_NaN(), "<real>nan</real>\n"},
        {PropertyList::Uid{7}, "<dict>\n\t<key>CF$UID</key>\n\t<integer>7</integer>\n</dict>\n"},
        {PropertyList::Array{PropertyList::Array{}, Dictionary{}},
         "<array>\n\t<array/>\n\t<dict/>\n</array>\n"},
        {PropertyList::Array{PropertyList::Data(52, 0xA5), PropertyList::Data{}},
         "<array>\n\t<data>\n\tpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWlpaWl\n"
         "\tpQ==\n\t</data>\n\t<data>\n\t</data>\n</array>\n"},
    };
    for (const auto& c : cases) {
        const std::string written = serializePropertyList(c.value, PropertyListFormat::xml);
        EXPECT_NE(written.find(std::string("<plist version=\"1.0\">\n") + c.xml + "</plist>\n"),
                  std::string::npos)
            << written;
    }
}

TEST(PropertyList, RefusesToCutATextAtANulCharacter) {
    const std::string withNul("a\0b", 3);
    for (const PropertyList& value : {PropertyList(withNul), PropertyList(Dictionary{{withNul, 1}})}) {
        EXPECT_EQ(serializePropertyList(value, PropertyListFormat::binary), "");
    }
}

TEST(PropertyList, IsJsonOfWholeCharactersWhateverItsBytes) {
    EXPECT_EQ(jsonText(PropertyList("\xc3\xa9 \xc3"), JsonStyle::compact), "\"\xc3\xa9 \xef\xbf\xbd\"");
}

TEST(PropertyList, NumbersCompareByValueAndBooleansStandApart) {
    EXPECT_EQ(PropertyList(0), PropertyList(0.0));
    EXPECT_FALSE(PropertyList(1) == PropertyList(true));
    EXPECT_FALSE(PropertyList(1) == PropertyList("1"));
    EXPECT_EQ(PropertyList(Dictionary{{"a", 1}, {"b", 2}}), PropertyList(Dictionary{{"b", 2}, {"a", 1}}));
}

TEST(PropertyList, ConvertsLikeTheExchangeFormatExpects) {
    EXPECT_EQ(PropertyList(" 0.75x").doubleValue(), 0.75);
    EXPECT_EQ(PropertyList("none").doubleValue(), 0.0);
    EXPECT_FALSE(PropertyList(Dictionary{}).doubleValue());
    EXPECT_EQ(PropertyList(1e300).integerValue(), std::numeric_limits<std::int64_t>::max());
    EXPECT_EQ(PropertyList(-2.9).integerValue(), -2);
    EXPECT_TRUE(PropertyList("yes").boolValue());
    EXPECT_FALSE(PropertyList("0").boolValue());
}

/// A binary list of these objects, whose references and offsets take so many bytes.
std::string binaryList(const std::vector<std::string>& objects, std::size_t offsetWidth,
                       std::size_t referenceWidth) {
    std::string bytes = "bplist00", offsets;
    for (const std::string& object : objects) {
        offsets += big(bytes.size(), offsetWidth);
        bytes += object;
    }
    return bytes + offsets + std::string(6, '\0') + big(offsetWidth, 1) + big(referenceWidth, 1) +
           big(objects.size(), 8) + big(0, 8) + big(bytes.size(), 8);
}

/// A binary list of containers that each hold the next one `fanOut` times.
/// The first may hold one further down before it.
std::string chainOfSharedArrays(std::size_t levels, std::size_t fanOut, std::size_t alsoInFirst = 0) {
    std::vector<std::string> arrays;
    for (std::size_t level = 0; level < levels; ++level) {
        const bool isTwice = level == 0 && alsoInFirst > 0;
        arrays.push_back(big(0xA0 + fanOut + (isTwice ? 1 : 0), 1));
        if (isTwice) arrays.back() += big(alsoInFirst, 2);
        for (std::size_t i = 0; i < fanOut; ++i) arrays.back() += big(level + 1, 2);
    }
    arrays.emplace_back("\x09");
    return binaryList(arrays, 2, 2);
}

/// A binary array whose items are all the same object.
std::string sharedItems(std::uint32_t count) {
    return binaryList({"\xAF\x12" + big(count, 4) + std::string(count, '\x01'), "\x09"}, 4, 1);
}

/// A binary list of arrays in each other, each with three texts of its own that all are the same bytes.
std::string arraysThatShareOneText(std::size_t levels, std::size_t length) {
    std::string bytes = "bplist00\x5F\x12" + big(length, 4) + std::string(length, 'x');
    std::string table;
    for (std::size_t i = 0; i < levels; ++i) {
        table += big(bytes.size(), 4);
        bytes += i + 1 < levels ? '\xA4' : '\xA3';
        for (std::size_t text = 0; text < 3; ++text) bytes += big(levels + 3 * i + text, 2);
        if (i + 1 < levels) bytes += big(i + 1, 2);
    }
    for (std::size_t i = 0; i < 3 * levels; ++i) table += big(8, 4);
    return bytes + table + std::string(6, '\0') + "\x04\x02" + big(4 * levels, 8) + big(0, 8) +
           big(bytes.size(), 8);
}

std::string nestedXml(int depth, const std::string& innermost) {
    std::string xml = "<plist>";
    for (int i = 0; i < depth; ++i) xml += "<array>";
    xml += innermost;
    for (int i = 0; i < depth; ++i) xml += "</array>";
    return xml + "</plist>";
}

std::string nestedNameSpaces(int depth) {
    std::string xml = "<plist>";
    for (int i = 0; i < depth; ++i) xml += "<array" + repeated(100, fmt::format(" xmlns:a{}x#='u'", i)) + ">";
    return xml + repeated(1000, "<true/>") + repeated(depth, "</array>") + "</plist>";
}

std::string nestedText(int depth) {
    const auto count = static_cast<std::size_t>(depth);
    return std::string(count, '(') + "x" + std::string(count, ')');
}

PropertyList nestedList(int depth) {
    PropertyList list = "x";
    for (int i = 0; i < depth; ++i) {
        PropertyList::Array outer;
        outer.push_back(std::move(list));
        list = std::move(outer);
    }
    return list;
}

TEST(PropertyList, WhatIsWrittenCanBeReadWhateverItsSize) {
    for (const auto format : {PropertyListFormat::xml, PropertyListFormat::binary}) {
        const PropertyList deepest = nestedList(kDeepestPropertyList);
        EXPECT_EQ(parsePropertyList(serializePropertyList(deepest, format)), deepest);
        Error error;
        EXPECT_EQ(serializePropertyList(nestedList(kDeepestPropertyList + 1), format, &error), "");
        EXPECT_EQ(error.message(), "no property list can hold more than 1024 levels");
        const PropertyList longest = PropertyList::Array(149'000, true);
        EXPECT_EQ(parsePropertyList(serializePropertyList(longest, format)), longest);
        EXPECT_EQ(serializePropertyList(PropertyList::Array(200'000, true), format, &error), "");
        EXPECT_NE(error.message().find("so many keys and values"), std::string::npos) << error.message();
    }
}

TEST(PropertyList, RefusesWhatWouldExhaustMemoryOrTheStack) {
    struct {
        const char* what;
        std::string bytes;
        bool accepted;
    } const cases[] = {
        {"shared items", sharedItems(100000), true},
        {"shared array", chainOfSharedArrays(3, 2), true},
        {"a kilobyte that expands to 15^60 values", chainOfSharedArrays(60, 14), false},
        {"binary within the depth", chainOfSharedArrays(kDeepestPropertyList, 1), true},
        {"binary nested too deeply", chainOfSharedArrays(kDeepestPropertyList + 1, 1), false},
        {"binary nested too deeply behind what was read before",
         chainOfSharedArrays(kDeepestPropertyList + 1, 1, kDeepestPropertyList / 2), false},
        {"XML within the depth", nestedXml(kDeepestPropertyList, "<true/>"), true},
        {"XML nested too deeply", nestedXml(kDeepestPropertyList + 1, ""), false},
        {"XML nested far too deeply", nestedXml(100000, ""), false},
        {"binary of three short texts that are one", arraysThatShareOneText(1, 1 << 20), true},
        {"binary of three long texts that are one", arraysThatShareOneText(1, 8 << 20), false},
        {"binary of 1,000 arrays that share one text", arraysThatShareOneText(1000, 1 << 20), false},
        {"XML with an element of 40,000 attributes",
         "<plist" + repeated(40000, " a#=''") + "><true/></plist>", false},
        {"XML with 1,000 attributes, and more in a text",
         "<plist" + repeated(1000, " a#='>'") + "><string>" + repeated(1100, "&lt;a b='#'/&gt;") +
             "</string></plist>",
         true},
        {"XML with an attribute declaration",
         "<!DOCTYPE plist [<!ATTLIST dict a (b|c) \"b\">]><plist><dict/></plist>", false},
        {"XML with 200 name spaces", nestedNameSpaces(2), true},
        {"XML with 300 name spaces", nestedNameSpaces(3), false},
        {"XML of a million values", "<plist><array>" + repeated(1000000, "<true/>") + "</array></plist>",
         false},
        {"XML of a text of 400,000 entities",
         "<plist><string>" + repeated(400000, "&amp;") + "</string></plist>", true},
        {"binary of 300,000 values", sharedItems(300000), false},
        {"an array that holds itself", chainOfSharedArrays(2, 1).replace(13, 1, 1, '\0'), false},
        {"text within the depth", nestedText(kDeepestPropertyList), true},
        {"text nested too deeply", nestedText(kDeepestPropertyList + 1), false},
        {"text nested far too deeply", nestedText(100000), false},
        {"text of a million values", "(" + replaceAll(std::string(1000000, 'a'), "a", "a,") + ")", false},
    };
    for (const auto& c : cases) {
        Error error;
        const auto start = test::ProcessorClock::now();
        EXPECT_EQ(parsePropertyList(c.bytes, &error).has_value(), c.accepted)
            << c.what << ": " << error.message();
        EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(1)) << c.what;
        EXPECT_NE(error.isSet(), c.accepted) << c.what;
    }
}

TEST(PropertyList, XmlHoldsWhatItsCharactersSay) {
    const auto array = [](auto... values) { return PropertyList::Array{values...}; };
    const auto infinity = std::numeric_limits<double>::infinity();
    struct {
        const char* xml;
        PropertyList value;
    } const cases[] = {
        {"<integer>08</integer><integer>0099</integer><integer>-017</integer>", array(8, 99, -17)},
        {"<integer> +5\n</integer><integer>0x1F</integer><integer>-0X10</integer>", array(5, 31, -16)},
        {"<integer>1&#50;</integer><integer>1<!-- c -->2</integer><integer>1<![CDATA[2]]>3</integer>",
         array(12, 12, 123)},
        {"<integer>00000000000000000000000000000000000000012</integer>", array(12)},
        {"<integer>-9223372036854775808</integer><integer>0xFFFFFFFFFFFFFFFF</integer>",
         array(std::numeric_limits<std::int64_t>::min(), std::numeric_limits<std::uint64_t>::max())},
        {"<integer>9223372036854775808</integer>", array(9223372036854775808.0)},
        {"<real>1<!-- c -->5</real><real>&#45;.5e1</real><real>+1.</real>", array(15.0, -5.0, 1.0)},
        {"<real>1.5e400</real><real>-1e400</real><real>1.5e-400</real>", array(infinity, -infinity, 0.0)},
        {"<data>QU<!-- c -->JD</data><data>QU&#74;D</data><data>\r\nQ U\tJD<?p?> </data>",
         array(PropertyList::Data{'A', 'B', 'C'}, PropertyList::Data{'A', 'B', 'C'},
               PropertyList::Data{'A', 'B', 'C'})},
        {"<data>/+8=</data><data>/+8</data><data>QQ</data><data/>",
         array(PropertyList::Data{255, 239}, PropertyList::Data{255, 239}, PropertyList::Data{'A'},
               PropertyList::Data{})},
        {"<date>02001-001-01T0:0:0Z</date><date>2001-01-01T00:<!-- c -->01:60Z</date>",
         array(PropertyList::Date{0}, PropertyList::Date{120})},
        {"<string>a<?pi?>b<!-- c --><![CDATA[&amp;]]>&#233;</string><string/>", array("ab&amp;\u00e9", "")},
        {"<string>a\r\nb\rc&#13;&#xA;</string>", array("a\nb\nc\r\n")},
        {"<dict><key/><true/><key>a<?pi?>b</key><false> </false></dict>",
         array(Dictionary{{"", true}, {"ab", false}})},
    };
    for (const auto& c : cases) {
        Error error;
        const auto value = parsePropertyList(fmt::format("<plist><array>{}</array></plist>", c.xml), &error);
        ASSERT_TRUE(value) << c.xml << error.message();
        EXPECT_EQ(*value, c.value) << c.xml;
        EXPECT_EQ(parsePropertyList(serializePropertyList(*value, PropertyListFormat::xml)), c.value)
            << c.xml;
    }
}

TEST(PropertyList, RefusesXmlThatIsNoPropertyList) {
    struct {
        const char* value;
        const char* reason;  // null: accepted
    } const cases[] = {
        {"<dict><key>a</key><!-- b --><integer> -0x10 </integer></dict>", nullptr},
        {"<string><![CDATA[<dict>]]>&lt;&#233;</string>", nullptr},
        {"<data>\n\tAAEC\n\t</data></plist>behind it", nullptr},
        {"<array><real> -1.5e3 </real><real>+infinity</real><date>1-01-01T00:00:00Z</date></array>", nullptr},
        {"<dict><key>a</key></dict>", "a key without value"},
        {"<dict><string>a</string></dict>", "an element where it may not stand"},
        {"<dict><key>a</key><key>b</key></dict>", "an element where it may not stand"},
        {"<array><key>a</key></array>", "an element where it may not stand"},
        {"<string>a<true/></string>", "an element where it may not stand"},
        {"<true/><true/>", "an element where it may not stand"},
        {"<array>a</array>", "text between elements"},
        {"<word>a</word>", "an element that is none of a property list"},
        {"<x:dict xmlns:x=\"y\"/>", "an element that is none of a property list"},
        {"<integer>18446744073709551616</integer>", "not a whole number of 64 bits"},
        {"<integer>-9223372036854775809</integer>", "not a whole number of 64 bits"},
        {"<integer>1.5</integer>", "not a whole number of 64 bits"},
        {"<integer/>", "not a whole number of 64 bits"},
        {"<real>1.5x</real>", "not a number"},
        {"<date>yesterday</date>", "not a date and time"},
        {"<date>2021-02-29T00:00:00Z</date>", "not a date and time"},
        {"<date>2021-02-28T00:00:00Z.</date>", "not a date and time"},
        {"<data>AA*C</data>", "data that is not base 64"},
        {"<data>AAECA</data>", "whole groups of base 64"},
        {"<data>AA==AAEC</data>", "whole groups of base 64"},
        {"<data>AA=</data>", "whole groups of base 64"},
        {"<data>====</data>", "whole groups of base 64"},
        {"<real>+-1</real>", "not a number"},
        {"<string>&unknown;</string>", "not well-formed XML"},
        {"<string>a", "not well-formed XML"},
        {"<array></dict>", "not well-formed XML"},
        {"", "no value"},
    };
    for (const auto& c : cases) {
        Error error;
        const bool read = parsePropertyList(fmt::format("<plist>{}</plist>", c.value), &error).has_value();
        EXPECT_EQ(read, c.reason == nullptr) << c.value << error.message();
        if (c.reason != nullptr) {
            EXPECT_NE(error.message().find(c.reason), std::string::npos)
                << c.value << ": " << error.message();
        }
    }
    Error error;
    EXPECT_FALSE(
        parsePropertyList("<!DOCTYPE plist [<!ENTITY a \"b\">]><plist><string>&a;</string></plist>", &error));
    EXPECT_NE(error.message().find("an entity declaration"), std::string::npos) << error.message();
}

std::string utf16(const std::string& text, bool isBigEndian, bool hasMark) {
    std::string bytes = !hasMark ? "" : isBigEndian ? "\xFE\xFF" : "\xFF\xFE";
    for (const char16_t unit : utf16FromUtf8(text)) {
        const char high = static_cast<char>(unit >> 8U);
        const char low = static_cast<char>(unit);
        bytes += {isBigEndian ? high : low, isBigEndian ? low : high};
    }
    return bytes;
}

TEST(PropertyList, ReadsUnicodeInEveryEncoding) {
    const std::string body =
        "<plist><dict><key>\u97f3</key><string>\U0001f941 e\u0301</string></dict></plist>";
    const std::string declared = "<?xml version=\"1.0\" encoding=\"UTF-16\"?>\n" + body;
    const PropertyList expected = Dictionary{{"\u97f3", "\U0001f941 e\u0301"}};
    for (const std::string& bytes :
         {body, "\xEF\xBB\xBF" + body, declared, utf16(body, false, true), utf16(body, true, true),
          utf16(declared, false, true), utf16(declared, true, true), utf16(declared, false, false),
          utf16(declared, true, false), utf16("{\"\u97f3\"=\"\U0001f941 e\u0301\";}", true, true)}) {
        Error error;
        EXPECT_EQ(parsePropertyList(bytes, &error), expected) << error.message();
    }
}

TEST(PropertyList, ReadsTheOldTextForm) {
    struct {
        const char* text;
        PropertyList value;
    } const cases[] = {
        {"{ key = value; \"a b\" = 'it\"s'; alone; last = com.x-y/z:1_$ }",
         Dictionary{{"key", "value"}, {"a b", "it\"s"}, {"alone", "alone"}, {"last", "com.x-y/z:1_$"}}},
        {" // a comment\n( a, /* another */ (), {}, \"\", )\n",
         PropertyList::Array{"a", PropertyList::Array{}, Dictionary{}, ""}},
        {"<00ff 1A\n2b>", PropertyList::Data{0, 255, 26, 43}},
        {"{a = <>; b = 5; a = again;}", Dictionary{{"a", "again"}, {"b", "5"}}},
        {R"("\a\b\f\n\r\t\v\"\'\\\q\
")",
         "\a\b\f\n\r\t\v\"'\\q\n"},
        {R"("\101\0053\341\256 \U00e9\Ud83e\Udd41\ud83e")", "A\0053\u00c6\ufb01 \u00e9\U0001f941ud83e"},
    };
    for (const auto& c : cases) {
        Error error;
        const auto value = parsePropertyList(c.text, &error);
        ASSERT_TRUE(value) << c.text << error.message();
        EXPECT_EQ(*value, c.value) << c.text;
    }
}

TEST(PropertyList, FaultsNameTheirByteInTheFile) {
    const std::string xml = "<plist><array>ab<integer>x</integer></array></plist>";
    struct {
        const char* what;
        std::string bytes;
        const char* message;
    } const cases[] = {
        {"text", xml, "XML property list, line 1, byte 14: text between elements"},
        {"behind a mark", "\xEF\xBB\xBF" + xml, "XML property list, line 1, byte 17: text between elements"},
        {"in UTF-16", utf16("<!-- \U0001f941 -->" + xml, true, true),
         "XML property list, line 1, byte 52: text between elements"},
        {"number", "<plist>\n<integer>x</integer></plist>", "byte 8: not a whole number"},
        {"element", "<plist><dict><key>a</key>\n<word/></dict></plist>",
         "line 2, byte 26: an element that is none"},
        {"mismatch", "<plist><array>\n</dict></plist>", "byte 15: not well-formed"},
        {"cut short", "<plist><array>", "byte 14: not well-formed"},
        {"data", "<plist><data>AAAA\nAA*A</data></plist>", "byte 20: data that is not base 64"},
        {"padding", "<plist><data>AAAAA</data></plist>", "byte 7: data that is not whole groups of base 64"},
        {"attribute declaration", "<!DOCTYPE plist [<!ATTLIST dict a CDATA 'x'>]><plist><dict/></plist>",
         "byte 17: an attribute declaration"},
        {"attributes",
         utf16("<!---->", true, true) + utf16("<plist" + repeated(1001, " a=''") + "/>", true, false),
         "byte 10032: an element with more than 1000 attributes"},
        {"half a pair", utf16("<a", false, true) + "\x3d\xd8>",
         "text property list, byte 6: half a character"},
        {"odd", utf16("<a>", false, true) + "x", "byte 8: half a character"},
        {"no list", "hello", "old-style property list, line 1, byte 0: neither a dictionary"},
        {"empty", "", "old-style property list, line 1, byte 0: neither a dictionary"},
        {"no semicolon", "{a = b c = d;}", "byte 7: no \";\""},
        {"no equals sign", "{a b}", "byte 3: no \"=\""},
        {"no comma", "(a\r\nb)", "line 2, byte 4: no \",\""},
        {"no end", "{a = (b,", "byte 8: it ends too early"},
        {"no quote", "( \"a)", "byte 2: a text that does not end"},
        {"no comment's end", "{ /* }", "byte 2: a comment that does not end"},
        {"hexadecimal", "<0 0>", "byte 1: data that is not"},
        {"first digit", "(<00g0>)", "byte 4: data that is not"},
        {"second digit", "(<0g>)", "byte 2: data that is not"},
        {"half of a pair", "(\"\\Ud83e.\")", "byte 2: half a surrogate pair"},
        {"NUL", "(\"a\\0\")", "byte 1: a text that is not valid Unicode, or holds a NUL"},
        {"junk", "{} x", "byte 3: something behind"},
        {"binary", "bplist00", "binary property list, byte 8: is cut short"},
        {"object outside", chainOfSharedArrays(1, 1).replace(12, 1, "\x7f"),
         "binary property list, byte 12: object 0 at offset 32520 outside"},
        {"half of a pair in binary", binaryList({"\xA1\x01", std::string("\x62\xdc\x00\x00\x41", 5)}, 1, 1),
         "half a surrogate pair"},
        {"marker", chainOfSharedArrays(1, 1).replace(11, 1, "\x70"), "byte 11: unknown marker 0x7"},
    };
    for (const auto& c : cases) {
        Error error;
        EXPECT_FALSE(parsePropertyList(c.bytes, &error)) << c.what;
        EXPECT_NE(error.message().find(c.message), std::string::npos) << c.what << ": " << error.message();
    }
}

TEST(PropertyList, ValuesAreFoundOnTheirLines) {
    const std::string old =
        "// a list\n{\n  a = (x,\n    y, {\n b = z; });\r\n  \"c\" =\n q; a = (w,\r v);\n}\n";
    const std::string xml =
        "<plist>\n<dict>\n<key>a</key>\n<array>\n<string>x</string>\n\n<dict>"
        "<key>b</key><true/></dict></array></dict>\n</plist>";
    const struct {
        const char* what;
        std::string bytes;
        PropertyListPath path;
        std::uint64_t line;  // 0: none
    } cases[] = {
        {"key", old, {"c"}, 6},
        {"last of two", old, {"a"}, 7},
        {"item behind a break of another kind", old, {"a", 1U}, 8},
        {"not there", old, {"a", 2U, "b"}, 5},
        {"nor what is above", old, {"d", 1U}, 0},
        {"key in XML", xml, {"a"}, 3},
        {"item in XML", xml, {"a", 0U}, 5},
        {"inside of an item", xml, {"a", 1U, "b"}, 7},
        {"a number is no key", xml, {"a", "0"}, 3},
        {"in UTF-16", utf16(xml, true, true), {"a", 0U}, 5},
        {"binary",
         serializePropertyList(PropertyList::Dictionary{{"a", 1}}, PropertyListFormat::binary),
         {"a"},
         0},
        {"no list", "a", {"a"}, 0},
    };
    for (const auto& c : cases) {
        const auto line =
            lineOfValue({reinterpret_cast<const std::uint8_t*>(c.bytes.data()), c.bytes.size()}, c.path);
        EXPECT_EQ(line.value_or(0), c.line) << c.what;
    }
}

TEST(PropertyList, WhatStandsBehindAnXmlListIsNotRewrittenAway) {
    struct {
        const char* behind;
        const char* message;  // null: rewritten
    } const cases[] = {
        {" \n<!-- comment --><?instruction?>\n", nullptr},
        {"\n<plist/>", "XML property list, line 2, byte 23: something behind the end"},
        {"<!-- not ended", "XML property list, line 1, byte 22: something behind the end"},
    };
    for (const auto& c : cases) {
        const std::string bytes = std::string("<plist><dict/></plist>") + c.behind;
        Error error;
        EXPECT_TRUE(parsePropertyList(bytes, &error)) << error.message();
        EXPECT_EQ(parsePropertyList(bytes, &error, PropertyListUse::rewriting).has_value(),
                  c.message == nullptr);
        if (c.message != nullptr) {
            EXPECT_NE(error.message().find(c.message), std::string::npos) << error.message();
        }
    }
    const std::string padded("<plist><dict/></plist>\0\0", 24);
    EXPECT_TRUE(parsePropertyList(padded, nullptr, PropertyListUse::rewriting));
}

/// A binary list of one dictionary with two pairs; its objects are the dictionary, two keys and one value,
/// the first pair's, and the second's unless that is another object.
std::string dictionaryOfTwoPairs(const std::string& firstKey, const std::string& secondKey,
                                 char secondValue = '\x03') {
    return binaryList({std::string("\xD2\x01\x02\x03", 4) + secondValue, firstKey, secondKey, "\x09"}, 1, 1);
}

TEST(PropertyList, RefusesKeysThatTheLibraryWouldEndTheProcessAt) {
    const std::string a = "\x51\x61";
    EXPECT_TRUE(parsePropertyList(dictionaryOfTwoPairs(a, "\x51\x62")));
    const std::string withNul("\x52\x62\x00", 3);
    const std::string wideNul("\x61\x00\x00", 3);
    const std::string number("\x10\x07");
    for (const std::string& key : {withNul, wideNul, number}) {
        Error error;
        EXPECT_FALSE(parsePropertyList(dictionaryOfTwoPairs(a, key), &error));
        EXPECT_NE(error.message().find("a key that is no text"), std::string::npos) << error.message();
    }
    EXPECT_FALSE(parsePropertyList("<plist><dict><key>a&#0;b</key><true/></dict></plist>"));
}

TEST(PropertyList, OfAKeyThatComesTwiceTheLastHoldsWhereTheFirstStood) {
    const std::string others = repeated(20, "<key>#</key><true/>");
    for (const std::string& bytes :
         {dictionaryOfTwoPairs("\x51\x61", "\x51\x61", '\x02'), std::string("{a = no; a = a;}"),
          "<plist><dict><key>a</key><true/>" + others + "<key>a</key><string>a</string></dict></plist>"}) {
        Error error;
        const auto value = parsePropertyList(bytes, &error);
        ASSERT_TRUE(value) << error.message();
        EXPECT_EQ(value->dictionary()->size(), bytes.find("19") == std::string::npos ? 1U : 21U);
        EXPECT_EQ(value->dictionary()->begin()->key, "a");
        EXPECT_EQ(value->dictionary()->begin()->value, PropertyList("a"));
    }
}

}  // namespace
}  // namespace qvct
