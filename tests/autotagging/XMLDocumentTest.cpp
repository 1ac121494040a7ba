#include "autotagging/xml/QVCTXMLDocument.h"
#include "autotagging/xml/QVCTXMLParser.h"
#include "autotagging/xml/XPathCost.h"
#include "autotagging/xml/XPathExpression.h"
#include "platform/data/Json.h"
#include "support/CapturedLog.h"
#include "support/Compressed.h"
#include "support/ProcessorClock.h"
#include "support/TemporaryFolder.h"
#include "support/Texts.h"

#include <chrono>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using test::gzipped;
using test::repeated;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;

std::shared_ptr<QVCTXMLDocument> document(std::string_view text) {
    return QVCTXMLDocument::initWithXMLData(text, "test.xml");
}

std::string compactJson(std::string_view xml) {
    const auto dictionary = QVCTXMLParser::dictionaryForXMLData(xml);
    return dictionary ? jsonText(PropertyList(*dictionary), JsonStyle::compact) : "nil";
}

TEST(XmlToDictionaries, KeepsItsShapeAndQuirks) {
    const struct {
        const char *xml, *json;
    } rows[] = {
        {"<a/>", R"({"a":{}})"},
        {"<a>x<b>y</b>z</a>", R"({"a":{"b":{"text":"xy"},"text":"z"}})"},
        {"<a>\n <b/>\n</a>", R"({"a":{"b":{"text":""},"text":""}})"},
        {"<a text='1'>two</a>", R"({"a":{"text":"two"}})"},
        {"<a text='1'></a>", R"({"a":{"text":"1"}})"},
        {"<a b='1'><b c='2'/></a>", R"({"a":{"b":["1",{"c":"2"}]}})"},
        {"<a><b n='1'/><c/><b n='2'/><b n='3'/></a>",
         R"({"a":{"b":[{"n":"1"},{"n":"2"},{"n":"3"}],"c":{}}})"},
        {"<P><Parameter name='n' valueString='v'/></P>",
         R"({"P":{"Parameter":{"name":"n","valueString":"v"}}})"},
        {"<p:a xmlns:p='u' p:x='1'/>", R"({"p:a":{"xmlns:p":"u","p:x":"1"}})"},
        {"<a> \n&lt;&#65;<![CDATA[<&>]]> <!-- no --><?p i?></a>", R"({"a":{"text":"<A<&>"}})"},
        {"<!DOCTYPE a [<!ENTITY e '<q>in</q>'>]><a>x&e;</a>", R"({"a":{"q":{"text":"xin"}}})"},
        {"<a><text/>own</a>", R"({"a":{"text":"own"}})"},
        {"<a>", "nil"},
        {"<a></b>", "nil"},
        {"<a/><b/>", "nil"},
        {"<a>&unknown;</a>", "nil"},
        {"<a b='1' b='2'/>", "nil"},
        {"<!DOCTYPE a [<!ENTITY e '<?xml'>]><a/>", R"({"a":{}})"},
        {"", "nil"},
        {"text", "nil"},
    };
    for (const auto& row : rows) EXPECT_EQ(compactJson(row.xml), row.json) << row.xml;
}

TEST(XmlToDictionaries, ManyDifferentChildrenTakeNoQuadraticTime) {
    const std::string xml = "<a>" + repeated(200000, "<c#/>");
    const auto start = test::ProcessorClock::now();
    const auto dictionary = QVCTXMLParser::dictionaryForXMLData(xml + "<c7/></a>");
    EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(20));
    ASSERT_TRUE(dictionary.has_value());
    EXPECT_EQ(dictionary->value("a")->dictionary()->size(), 200000U);
    EXPECT_EQ(dictionary->value("a")->dictionary()->value("c7")->array()->size(), 2U);
}

TEST(XmlDocument, ReadsPlainAndCompressedFilesByTheirExactExtension) {
    const test::TemporaryFolder folder;
    const test::CapturedLog log;
    const std::string xml = "<Patch name='a'/>";
    const auto opens = [&](const char* name, std::string_view bytes) {
        const URL url = URL::fileURLWithPath(folder.write(name, bytes));
        return QVCTXMLDocument::initWithContentsOfURL(url)->isMatchingXPath("/Patch[@name='a']");
    };
    EXPECT_TRUE(opens("a.xml", xml));
    EXPECT_TRUE(opens("a b \xc3\xa4%20.xml", xml));
    EXPECT_TRUE(opens("a.zxml", gzipped(xml)));
    EXPECT_FALSE(opens("a.ZXML", gzipped(xml)));
    EXPECT_TRUE(opens("b.ZXML", xml));
    EXPECT_FALSE(opens("plain.zxml", xml));
    EXPECT_FALSE(opens("nothing.zxml", gzipped("")));
    EXPECT_FALSE(opens("empty.xml", ""));
    const URL upper = URL::fileURLWithPath(folder.path("a.ZXML"));
    EXPECT_TRUE(QVCTXMLDocument::initWithContentsOfQVZippedXMLURL(upper)->hasContent());
}

TEST(XmlDocument, WithoutContentEveryQueryAnswersNothing) {
    const test::TemporaryFolder folder;
    const test::CapturedLog log;
    for (const std::string& path : {folder.path("missing.xml"), folder.path(), folder.path("missing.zxml")}) {
        const auto none = QVCTXMLDocument::initWithContentsOfURL(URL::fileURLWithPath(path));
        ASSERT_NE(none, nullptr);
        EXPECT_FALSE(none->hasContent());
        EXPECT_THAT(none->nodesForXPath("//*"), IsEmpty());
        EXPECT_FALSE(none->isMatchingXPath("/*"));
        EXPECT_EQ(none->JSONString(), std::nullopt);
        EXPECT_EQ(none->JSONStringForXPath("/*"), std::nullopt);
        EXPECT_EQ(none->XMLData(), "");
    }
    ASSERT_EQ(log.messages().size(), 3U);
    EXPECT_THAT(log.messages()[0], HasSubstr("missing.xml"));
}

TEST(XmlDocument, RecoversWhatMakesSense) {
    const test::CapturedLog log;
    EXPECT_TRUE(document("<Patch><Channels><Channel mode='Mono'><Plug")
                    ->isMatchingXPath("/Patch/Channels/Channel[@mode='Mono']"));
    EXPECT_TRUE(document("<a><b></c></a>")->isMatchingXPath("/a/b"));
    EXPECT_FALSE(document("no XML at all")->isMatchingXPath("/*"));
    EXPECT_THAT(log.messages().front(), HasSubstr("test.xml: line 1: "));
}

TEST(XmlDocument, DamagedFilesDoNotFloodTheLog) {
    const test::CapturedLog log;
    document("<a>" + repeated(1000, "<b c='1' c='2'/>") + "</a>");
    EXPECT_LE(log.messages().size(), 6U);
}

TEST(XmlDocument, NodesAndJson) {
    const auto three = document("<a><b n='1'>x</b><b n='2'/><b n='3'/></a>");
    std::vector<std::string> nodes;
    for (const auto& node : three->nodesForXPath("/a/b")) nodes.push_back(node->XMLData());
    EXPECT_THAT(nodes, ElementsAre("<b n=\"1\">x</b>", "<b n=\"2\"/>", "<b n=\"3\"/>"));
    EXPECT_EQ(three->JSONStringForXPath("//b"),
              "{\n    \"b\": {\n        \"n\": \"1\",\n        \"text\": \"x\"\n    }\n}");
    EXPECT_EQ(three->JSONStringForXPath("/a/c"), std::nullopt);
    EXPECT_EQ(three->JSONStringForXPath("//@n"), std::nullopt);  // an attribute alone is no XML text
    EXPECT_THAT(*three->JSONString(), HasSubstr("\"n\": \"3\""));
    EXPECT_EQ(document("<a/>")->JSONString(), "{\n    \"a\": {}\n}");
    for (const char* noNodes : {"count(//b)", "//b/@n = 1", "string(/a)", "b", "", "//namespace::*", "//c"}) {
        EXPECT_FALSE(three->isMatchingXPath(noNodes)) << noNodes;
        EXPECT_THAT(three->nodesForXPath(noNodes), IsEmpty()) << noNodes;
    }
}

TEST(XmlDocument, JsonOfTheTreeIsThatOfItsText) {
    for (const char* xml :
         {"<a b='1' c=\"2&quot;'&#10;&#13;&amp;\"> x <!-- c "
          "--><b>y</b><?pi?>z<![CDATA[]]]]><![CDATA[>&]]></a>",
          "<p:a xmlns:p='u' xmlns='v' p:b='1' xml:lang='de'><p:c xmlns:q='w' q:b='2' b='3'/><c/> "
          "<c/></p:a>",
          "<q:a q:b='1'><q:b/></q:a>", "<a>&#13;&#x1F3B5;\t<text>1</text>2</a>", "<a b='1'><b/><b/></a>",
          "<a xmlns=''><b xmlns=''/></a>", "<?xml version='1.0' encoding='ISO-8859-1'?><a b='\xe9'>\xe9</a>",
          "<!DOCTYPE a [<!ATTLIST a b CDATA 'd'><!ENTITY e 'x'>]><a>&e;</a>", "<a><b c='1' c='2'/>"}) {
        const test::CapturedLog log;
        const auto parsed = document(xml);
        EXPECT_EQ(parsed->JSONString(), QVCTXMLDocument::JSONStringWithData(parsed->XMLData())) << xml;
        const auto inner = parsed->firstNodeForXPath("/*/*");
        if (!inner) continue;
        EXPECT_EQ(parsed->JSONStringForXPath("/*/*"), QVCTXMLDocument::JSONStringWithData(inner->XMLData()))
            << xml;
    }
}

TEST(XmlDocument, WrongExpressionsSelectNothingAndAreLoggedOnce) {
    const auto xml = document("<a/>");
    const test::CapturedLog log;
    for (const char* wrong : {"/a[[", "@", "'open", "file://~/rules/x.xpath", "/a)|(/a"}) {
        EXPECT_FALSE(xml->isMatchingXPath(wrong)) << wrong;
        EXPECT_THAT(xml->nodesForXPath(wrong), IsEmpty());
    }
    EXPECT_EQ(log.messages().size(), 5U);
    EXPECT_THAT(log.messages()[0], HasSubstr("XPath \"/a[[\", character 5: "));
    EXPECT_FALSE(xml->isMatchingXPath("/a[normalize-space('b', 'c') = 'c']"));
    for (const auto& [length, rest] : {std::pair{200U, "\", "}, {201U, "...\", "}}) {
        EXPECT_FALSE(xml->isMatchingXPath(std::string(length, '[')));
        EXPECT_THAT(log.messages().back(), HasSubstr("XPath \"" + std::string(200, '[') + rest));
    }
}

TEST(XmlDocument, AWrongExpressionIsToldOnceHoweverOftenItIsAsked) {
    const test::CapturedLog log;
    const auto xml = document("<a/>");
    for (const char* expression : {"/first[", "/second[", "/first["})
        EXPECT_FALSE(xml->isMatchingXPath(expression));
    EXPECT_EQ(log.messages().size(), 2U);
}

TEST(XmlDocument, HostileExpressionsEnd) {
    const test::CapturedLog log;
    Error error;
    const std::string deep = std::string(20000, '(') + "1" + std::string(20000, ')');
    EXPECT_EQ(XPathExpression::compile(deep, &error), nullptr);
    EXPECT_TRUE(error.isSet());
    const std::string longest = "/a" + std::string(kLongestXPath - 2, ' ');
    EXPECT_NE(XPathExpression::compile(longest), nullptr);
    EXPECT_EQ(XPathExpression::compile(longest + " "), nullptr);
    const std::string wide = "<a>" + repeated(5000, "<b/>") + "</a>";
    const auto start = test::ProcessorClock::now();
    EXPECT_FALSE(document(wide)->isMatchingXPath("//*[//*[//*[contains(@x,'1')]]]"));
    EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(30));
    EXPECT_EQ(log.messages().size(), 1U);
}

TEST(XmlDocument, HostileEntitiesAndNestingEnd) {
    const test::CapturedLog log;
    for (const char* body : {"<Patch><c>&k;</c></Patch>", "<Patch name='&k;'><c/></Patch>"}) {
        const auto start = test::ProcessorClock::now();
        const auto xml = document(test::entityBomb() + body);
        EXPECT_FALSE(xml->isMatchingXPath("/Patch[string-length(.)>100000 or string-length(@name)>100000]"));
        EXPECT_FALSE(xml->isMatchingXPath("/Patch[contains(@name,'aaa')]"));
        EXPECT_LT(xml->JSONString().value_or("").size(), 100000U);
        EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(10));
    }
    const std::string deep = repeated(10000, "<a>");
    EXPECT_TRUE(document(deep)->isMatchingXPath("/a/a/a"));
    EXPECT_TRUE(document(deep)->JSONString().has_value());
}

TEST(XmlDocument, NothingOutsideIsEverRead) {
    const test::TemporaryFolder folder;
    const test::CapturedLog log;
    const std::string secret = "file://" + folder.write("secret.txt", "secret words");
    const std::string dtd = "file://" + folder.write("outside.dtd", "<!ENTITY e 'secret words'>");
    for (const std::string& xml : {"<!DOCTYPE a [<!ENTITY e SYSTEM '" + secret + "'>]><a>&e;</a>",
                                   "<!DOCTYPE a SYSTEM '" + dtd + "'><a>&e;</a>",
                                   "<!DOCTYPE a [<!ENTITY % p SYSTEM '" + dtd + "'>%p;]><a>&e;</a>"}) {
        EXPECT_FALSE(document(xml)->isMatchingXPath("/a[contains(.,'secret')]")) << xml;
        EXPECT_THAT(document(xml)->JSONString().value_or(""), testing::Not(HasSubstr("secret"))) << xml;
        EXPECT_THAT(compactJson(xml), testing::Not(HasSubstr("secret"))) << xml;
    }
}

/// The walk of common expressions must agree with the XML library in everything.
TEST(LocationPath, SelectsTheNodeThatTheLibrarySelects) {
    const std::string text =
        "<P xmlns:x='u' m=''><C m='Mono' v='1.50' w=' 7 ' n='abc'/>"
        "<C m='Stereo' v='x' x:m='Mono'><D v='-1'/><D v='2' k='Vorthal &amp; more'/><D/></C><x:C m='q'/>text"
        "<C m=\"it's\" v='' w='1e3'><D v='2' k='b'/><D v='2' k='b' l='1'/></C></P>";
    const auto plain = document(text);
    const auto withEntities = document("<!DOCTYPE P [<!ENTITY e 'x'>]>" + replaceAll(text, "&amp;", "&e;"));
    const std::string expressions =
        "/P;/Q;/P/C;/P/C[1];/P/C[2];/P/C[3];/P/C[4];/P/C/D[2];(/P/C/D)[4];(/P/C/D)[6];"
        " ( / P / C [ @m = 'Stereo' ] ) [ 1 ] ;/P/C[@m='Mono'];/P/C[@m!='Mono'];/P/C[@x!='Mono'];"
        "/P/C[@m=\"it's\"];/P/C[@v=1];/P/C[@v>1];/P/C[@v<1];/P/C[@v!=1];/P/C[@w=7];/P/C[@w>=1000];"
        "/P/C[@w<=7];/P/C[ @w >= 1000 ];/P/C/D[@v<0];/P/C/D[@v>=2][2];"
        "/P/C/D[2][@v>=2];/P/C/D[@k][@l];/P/C/D[@k and @l];"
        "/P/C/D[@k='zz' or @l=1];/P/C/D[@k='zz' or @l=1 and @v=3];/P/C/D[(@k='b' or @l) and @v=2][2];"
        "/P/C[contains(@m,'ere')];/P/C[contains(@zz,'')];/P/C[contains(@zz,'a')];"
        "/P/C[starts-with(@n,'ab')];/P/C[starts-with(@n,'b')];/P/C/D[contains(@k,'rth')];"
        "/P/C/D[@k='Vorthal & more'];/P[@m=''];/P[@m];/P[@m=0];/P/C[@m='Mono'and@v=1];"
        "/P/C/D[@v=2 and contains(@k,'b') and @l>0]";
    for (const std::string& expression : split(expressions, ";")) {
        const auto compiled = XPathExpression::compile(expression);
        ASSERT_NE(compiled, nullptr) << expression;
        EXPECT_TRUE(compiled->isLocationPath()) << expression;
        for (const auto& xml : {plain, withEntities}) {
            const auto all = xml->nodesForXPath(expression);
            const auto first = xml->firstNodeForXPath(expression);
            EXPECT_EQ(first ? first->XMLData() : "none", all.empty() ? "none" : all.front()->XMLData())
                << expression;
        }
    }
}

TEST(LocationPath, LeavesOtherFormsToTheLibrary) {
    const std::string others =
        "//C;/P/*;/P/@m;/P/C | /P/D;/P/C[last()];/P/C[@v=1.5];P/C;/P/C[D];/P/C[not(@m)];/P/C['1'=@v];"
        "/P/C[@v<'2'];/P/C[position()=1];/;/P/text();/P/child::C;/P/C[@v=-1];(/P/C);/P/C[0];count(/P/C);"
        "/P/C[1234567890];/P/text ( );/P\u00e4;/P/C[@m\u00e4='a']";
    for (const std::string& other : split(others, ";")) {
        const auto compiled = XPathExpression::compile(other);
        ASSERT_NE(compiled, nullptr) << other;
        EXPECT_FALSE(compiled->isLocationPath()) << other;
    }
}

TEST(LocationPath, TakesNoMoreStepsForALongAttributeElsewhere) {
    const test::CapturedLog log;
    const auto xml =
        document("<P n='" + std::string(1 << 20, 'x') + "'>" + repeated(30000, "<a n='#'/>") + "</P>");
    EXPECT_TRUE(xml->isMatchingXPath("/P/a[@n='29999']"));
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST(XMLDocument, TooLargeForMemoryIsCutShort) {
    const test::CapturedLog log;
    const auto document = QVCTXMLDocument::initWithXMLData(
        "<P><first/>" + repeated(340000, "<a b='' c=''/>") + "<last/></P>", "huge.xml");
    EXPECT_TRUE(document->isMatchingXPath("/P/first"));
    EXPECT_TRUE(document->isMatchingXPath("/P/a[72999]"));
    EXPECT_FALSE(document->isMatchingXPath("/P/a[73000]"));
    EXPECT_FALSE(document->isMatchingXPath("/P/last"));
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("huge.xml: line 1: more than 219000 elements")));
}

/// Little-endian; a "*" becomes U+3C3C, both bytes of which are those of a "<".
std::string utf16(std::string_view ascii) {
    std::string wide = "\xff\xfe";
    for (const char c : ascii) wide += c == '*' ? std::string("<<") : std::string{c, '\0'};
    return wide;
}

TEST(XMLDocument, WhatTheLibraryComparesWithAllOthersIsBounded) {
    const std::string many = repeated(40000, " a#=''");
    std::string nested;
    for (int depth = 0; depth < 60; ++depth)
        nested += "<b" + repeated(200, " xmlns:n" + std::to_string(depth) + "x#='u'") + ">";
    const struct {
        const char* fault;
        std::string xml;
    } rows[] = {
        {"line 2: an element with more than 1000 attributes", "<P>\n<b" + many + "/></P>"},
        {"line 1001: an element with more than 1000 attributes",
         "<P" + repeated(40000, " xmlns:a#=\n'>'") + "/>"},
        {"line 1: an element with more than 1000 attributes",
         utf16("<P" + replaceAll(many, "''", "'*'") + "/>")},
        {"line 1: texts in the encoding \"iso-8859-1\" are not read",
         utf16("<?xml version='1.0' encoding='ISO-8859-1'?><P/>")},
        {"line 1: an entity with more than 1000 attributes",
         "<!DOCTYPE P [<!ENTITY e \"&#60;b" + replaceAll(many, "=", "&#61;") + "/>\">]><P>&e;</P>"},
        {"line 1: more than 1000 attributes declared",
         "<!DOCTYPE P [<!ATTLIST P" + repeated(40000, " a# CDATA ''") + ">]><P/>"},
        {"line 1: more than 256 name spaces", nested + repeated(20000, "<n0x0:c/>")},
        {"line 1: texts in the encoding \"utf-7\" are not read",
         "<?xml version='1.0' encoding='UTF-7'?><P/>"},
        {"line 1: texts in the encoding \"iso-2022-jp\" are not read",
         "<?xml version='1.0' encoding='ISO-2022-JP'?><P/>"},
        {"line 1: an XML declaration that is too long",
         "<?xml version='1.0'" + std::string(1024, ' ') + "encoding='UTF-7'?><P/>"},
        {"line 1: an element with more than 1000 attributes",
         "<!-- a='--><P b='>'" + repeated(40000, " a#='>'") + "/>"},
    };
    for (const auto& row : rows) {
        const test::CapturedLog log;
        const auto start = test::ProcessorClock::now();
        EXPECT_FALSE(document(row.xml)->isMatchingXPath("//c")) << row.fault;
        QVCTXMLParser parser(QVCTXMLParser::largestJson(row.xml.size()));
        const auto dictionary = parser.objectWithData(row.xml);
        EXPECT_TRUE(dictionary ? dictionary->size() == 1 : parser.error().code != 0) << row.fault;
        EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(2)) << row.fault;
        EXPECT_THAT(log.messages(), testing::Contains(HasSubstr(std::string("test.xml: ") + row.fault)));
    }
    EXPECT_TRUE(
        document("<P" + repeated(500, " a#='='") + "><c d='&lt;=\"='/></P>")->isMatchingXPath("/P/c"));
    EXPECT_TRUE(document("<P>" + repeated(1100, "&lt;a b='#'/&gt;") + "<c/></P>")->isMatchingXPath("/P/c"));
    for (const char* encoding : {"ISO_8859-1", "x-sjis", "cp850", "x-mac-roman"}) {
        const auto xml =
            document(std::string("<?xml version='1.0' encoding='") + encoding + "'?><P><c/></P>");
        EXPECT_TRUE(xml->isMatchingXPath("/P/c")) << encoding;
    }
    EXPECT_TRUE(document(utf16("<P a='*'>" + repeated(600, "<b d='>*' e=''/>") + "<c/></P>"))
                    ->isMatchingXPath("/P/c"));
}

/// A thousand plug-ins with three parameters each.
std::string largePatch() {
    const std::string parameters = repeated(3, "<Parameter name='p#' value='#'/>");
    return "<P><Default name='n7'/>" +
           repeated(1000, "<Plugin name='n#'>" + replaceAll(parameters, "#", "1") + "text #</Plugin>") +
           "</P>";
}

TEST(XPath, WhatCostsMoreThanItsStepsIsBounded) {
    const std::string flat = "<P>" + repeated(3000, "<a n='#'>t#</a>") + "</P>";
    const std::string empty = "<P>" + repeated(90000, "<a/>") + "</P>";
    const std::string text = "<P><t>" + std::string(1 << 20, 'x') + "</t>" + repeated(3000, "<a/>") + "</P>";
    const std::string attribute =
        "<P n='" + std::string(1 << 20, 'x') + "'>" + repeated(30000, "<a/>") + "</P>";
    const std::string entities =
        "<!DOCTYPE P [<!ENTITY e '" + std::string(100000, 'x') + "'>]><P>" + repeated(15000, "&e;") + "</P>";
    const std::string same = "<P>" + repeated(1000, "<a>" + std::string(1000, 'x') + "</a>") + "</P>";
    const std::string nested = repeated(250, "<a>") + std::string(1 << 20, 'x') + repeated(250, "</a>");
    const char* const steps = "takes too many steps in this document";
    const char* const bytes = "reads too much text in this document";
    const struct {
        const std::string& xml;
        std::string expression;
        const char* reason;
    } rows[] = {
        {flat, "//*[//* = //*][//q]", steps},
        {flat, "//*[//a < //a/text()]", steps},
        {flat, "//*[//a | //a]", steps},
        {flat, "//*/following::*", steps},
        {flat, "//a[preceding::a/following::a[//q]]", steps},
        {flat, "//a/preceding-sibling::a/parent::*[//q]", steps},
        {empty, "//*[/ = 'x']", steps},
        {empty, "//*[/ + 1]", steps},
        {text, "//*[contains(/, 'q')]", steps},
        {text, "//*[normalize-space(/) = 'q']", steps},
        {text, "//*[translate(/, 'q', 'x') = 'q']", steps},
        {text, "//*[string-length() = string-length(/) + 1]", steps},
        {attribute, "//*[contains(/P/@n, 'q')]", steps},
        {same, "//a[//a != //a]", steps},
#ifndef QVCT_ADDRESS_SANITIZER  // whose allocator takes a hundred times as long for a text that grows
        {same, "//a[//a[. = /] != //a]", steps},
#endif
        {nested, "//a[//a != //a]", bytes},
        {text, "/P[contains(concat(/P" + repeated(400, ",string(/)") + "), 'q')]", bytes},
        {text, "/P[contains(concat(/P" + repeated(400, ",/") + "), 'q')]", bytes},
        {attribute, "/P[contains(concat(@n" + repeated(400, ",@n") + "), 'q')]", bytes},
        {entities, "/P[contains(., 'q')]", bytes},
    };
    for (const auto& row : rows) {
        const test::CapturedLog log;
        const auto xml = document(row.xml);
        const auto start = test::ProcessorClock::now();
        EXPECT_FALSE(xml->isMatchingXPath(row.expression));
        EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(3))
            << row.expression.substr(0, 99);
        EXPECT_THAT(log.messages(), ElementsAre(AllOf(HasSubstr("XPath \"" + row.expression.substr(0, 99)),
                                                      HasSubstr(row.reason))));
    }
}

TEST(XPath, ReadsAsMuchTextAsItMayAndNoByteMore) {
    const test::CapturedLog log;
    const std::string expression = "/P[contains(concat(@n" + repeated(40, ",@n") + "), 'x')]";
    const std::size_t longest = kMostXPathText / costOfXPath(expression).texts;
    ASSERT_LT(longest, 500000U);
    for (const std::size_t length : {longest, longest + 1})
        EXPECT_EQ(document("<P n='" + std::string(length, 'x') + "'/>")->isMatchingXPath(expression),
                  length == longest);
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("reads too much text")));
}

TEST(XPath, FunctionsTakeTimeAsTheirTextsAreLong) {
    const test::CapturedLog log;
    const auto xml =
        document("<P><t>" + std::string(1 << 18, 'x') + "</t><k>" + std::string(60000, 'x') + "y</k></P>");
    const auto start = test::ProcessorClock::now();
    for (const char* expression :
         {"/P[not(contains(t, k))]", "/P[substring-before(t, k) = '']", "/P[substring-after(t, k) = '']",
          "/P[translate(t, k, '') = '']",
          "/P[string-length(translate(k, '\u4e00xy\u00e9xy', 'z\u00e9')) = 60000]",
          "/P[translate('-\u00e9a\u4e00', 'a\u00e9a', '\U0001F600bc') = '-b\U0001F600\u4e00']",
          "/P[substring-before('a\u00e9b', '\u00e9') = 'a' and substring-before('ab', '') = '']",
          "/P[substring-after('a\u00e9b', '\u00e9') = 'b' and substring-after('ab', '') = 'ab']",
          "/P[contains('', '') and contains(11, 1) and not(contains('', 'a'))]",
          "/P[normalize-space(' a  b \t\n') = 'a b' and normalize-space('  ') = '']",
          "//k[string-length(normalize-space()) = 60001]"})
        EXPECT_TRUE(xml->isMatchingXPath(expression)) << expression;
    EXPECT_LT(test::ProcessorClock::now() - start, std::chrono::seconds(2));
    for (const char* expression : {"/P[contains(t)]", "/P[translate(t, k)]", "/P[normalize-space(t, k)]"})
        EXPECT_FALSE(xml->isMatchingXPath(expression)) << expression;
    EXPECT_THAT(log.messages(), testing::Each(HasSubstr("wrong number of arguments")));
}

TEST(XPath, OrdinaryExpressionsOverLargePatchesStayWithinTheBounds) {
    const test::CapturedLog log;
    const auto xml = document(largePatch());
    for (const char* expression :
         {"//Plugin//Parameter", "//Plugin[@name = //Default/@name]", "//Default[@name = //Plugin/@name]",
          "//Plugin[. = 'text 999']", "//Plugin[contains(., 'text 999')]", "//Parameter[@value > 0]/..",
          "//Parameter/ancestor::Plugin", "//Default | //Plugin[@name='n9']",
          "//Plugin[Parameter/@value = 1]", "//Plugin[following-sibling::Plugin[@name='n999']]",
          "//Parameter[contains(concat(@name, @value), '11')]", "//Plugin[not(preceding-sibling::Plugin)]",
          "//*[self::Plugin or self::Default][@name = 'n7']",
          "//Plugin[count(Parameter[number(@value) >= 1]) = 2]", "//Plugin[last()]"})
        EXPECT_TRUE(xml->isMatchingXPath(expression)) << expression;
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST(XMLDocument, JsonIsCountedBeforeItIsMade) {
    const std::string text = repeated(15000, "&e;");
    for (const std::string& xml :
         {"<!DOCTYPE P [<!ENTITY e '" + std::string(100000, 'x') + "'>]><P>" + text + "</P>",
          "<!DOCTYPE P [<!ENTITY e '" + repeated(3000, "<a/>") + "'>]><P>" + text + "</P>",
          repeated(250, "<a>") + repeated(40000, "<b/>") + repeated(250, "</a>")}) {
        const test::CapturedLog log;
        EXPECT_EQ(document(xml)->JSONString(), std::nullopt);
        EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("JSON grows too large")));
    }
}

TEST(XMLDocument, TooLargeForAScriptHasNoJson) {
    const test::CapturedLog log;
    const auto document =
        QVCTXMLDocument::initWithXMLData("<P>" + std::string(std::size_t{9} << 20, 'x') + "<b>" +
                                             std::string(std::size_t{9} << 20, 'y') + "</b></P>",
                                         "long.xml");
    EXPECT_EQ(document->JSONString(), std::nullopt);
    EXPECT_EQ(document->JSONStringForXPath("/P"), std::nullopt);
    EXPECT_NE(document->JSONStringForXPath("/P/b"), std::nullopt);
    EXPECT_THAT(log.messages(), testing::Contains(testing::HasSubstr("is refused (at most 16777216)")));
}

}  // namespace
}  // namespace qvct
