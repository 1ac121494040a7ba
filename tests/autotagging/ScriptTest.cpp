#include "autotagging/scripts/QVCTJavaScriptUtilities.h"
#include "autotagging/scripts/RegularExpressionGuard.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "platform/data/Json.h"
#include "support/CapturedLog.h"

#include <cstdio>
#include <thread>

#include <gmock/gmock.h>

namespace qvct {
namespace {

using std::chrono::milliseconds;
using testing::ElementsAre;
using testing::HasSubstr;
using testing::IsEmpty;
using testing::SizeIs;

std::shared_ptr<QVCTXMLDocument> sample() {
    return QVCTXMLDocument::initWithXMLData("<P><a n='1'/><a n='2'/></P>", "test.xml");
}

std::string resultOf(std::string_view script) {
    const auto result = QVCTJavaScriptUtilities::tagsForXMLDocument(sample(), script);
    return result ? jsonText(PropertyList(*result), JsonStyle::compact) : "nil";
}

/// What `main` returns when that is its body.
std::string resultOfMain(const std::string& body) {
    return resultOf("function main() { " + body + " }");
}

/// Other limits for as long as it lives.
class Limits {
  public:
    explicit Limits(const ScriptLimits& limits) { QVCTJavaScriptUtilities::setLimits(limits); }
    Limits(const Limits&) = delete;
    Limits& operator=(const Limits&) = delete;
    ~Limits() { QVCTJavaScriptUtilities::setLimits({}); }
};

TEST(Script, ResultsBecomeDictionariesTextsNumbersAndBooleans) {
    const test::CapturedLog log;
    const struct {
        const char *body, *result;
    } rows[] = {
        {"return [{label: 'a', level: 0.5}]", R"([{"label":"a","level":0.5}])"},
        {"return [{a: {b: [1, true, 'x', {c: false}]}}]", R"([{"a":{"b":[1,true,"x",{"c":false}]}}])"},
        {"return [null, undefined, Symbol('s'), {a: null, b: undefined}]", "[{}]"},
        {"return [[1], [], 'text']", R"([[1],[],"text"])"},
        {"return ['\\ud800', '\\u00e4\\ud83c\\udfb5']", "[\"\xef\xbf\xbd\",\"\xc3\xa4\xf0\x9f\x8e\xb5\"]"},
        {"return []", "[]"},
        {"return null", "nil"},
        {"return", "nil"},
    };
    for (const auto& row : rows) EXPECT_EQ(resultOfMain(row.body), row.result) << row.body;
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST(Script, WhatIsNoArrayOrFailsIsLoggedAndNothing) {
    for (const char* body :
         {"return 'text'", "return 5", "return {length: 1}", "throw new Error('boo')",
          "return [{get label() { throw 'no' }}]",
          "return [new Proxy({}, {ownKeys() { return ['a'] }, getOwnPropertyDescriptor() { return {value: 1, "
          "enumerable: true, configurable: true} }, get() { throw 1 }})]",
          "var a = {}; a.a = a; return [a]", "return new Array(1e9)", "return [new Array(3000).fill(1)]",
          "return ['x'.repeat(2e6)]", "missing()"}) {
        const test::CapturedLog log;
        EXPECT_EQ(resultOfMain(body), "nil") << body;
        ASSERT_THAT(log.messages(), SizeIs(1)) << body;
        EXPECT_THAT(log.messages()[0], HasSubstr("JavaScript Exception: ")) << body;
    }
    for (const char* script : {"", "var main = 5", "var x = 1"}) {
        const test::CapturedLog log;
        EXPECT_EQ(resultOf(script), "nil") << script;
        EXPECT_THAT(log.messages(), ElementsAre("JavaScript Exception: TypeError: main is not a function"))
            << script;
    }
}

TEST(Script, GoesOnAfterAFault) {
    const test::CapturedLog log;
    EXPECT_EQ(resultOf("function main() { return [1]; } missing.x;"), "[1]");
    EXPECT_THAT(log.messages(),
                ElementsAre("JavaScript Exception: ReferenceError: Can't find variable: missing"));
}

TEST(Script, SeesTheDocumentTheLogAndTheLibraryAndNoOtherScriptsGlobals) {
    const test::CapturedLog log;
    EXPECT_EQ(
        resultOfMain(
            "return [document.isMatchingXPath('/P/a[2]'), document.isMatchingXPath('/P/a[3]'), "
            "JSON.parse(document.JSONStringForXPath('/P/a[2]')).a.n, document.JSONStringForXPath('/b'), "
            "JSON.parse(document.JSONString()).P.a.length]"),
        R"([true,false,"2",2])");
    EXPECT_EQ(resultOf("var n = 0; for (var k in document) n++; function main() { return [n, typeof "
                       "document.context]; }"),
              R"([3,"undefined"])");
    EXPECT_EQ(
        resultOfMain("var g = QVSearchKit.api.GetPlugInParameter; return [QVSearchKit.api.VERSION, g([{name: "
                     "'x'}, {name: '5', v: 1}], 5).v, g([], 'x'), g({name: 'x'}, 'x')]"),
        R"(["1.0.0",1])");
    EXPECT_EQ(
        resultOf("var leak = 1; QVSearchKit.api.VERSION = 'changed'; function main() { return [leak]; }"),
        "[1]");
    EXPECT_EQ(resultOfMain("return [typeof leak, QVSearchKit.api.VERSION]"), R"(["undefined","1.0.0"])");
    EXPECT_THAT(log.messages(), IsEmpty());
    resultOf("console.log('one'); __log({}); function main() {}");
    EXPECT_THAT(log.messages(), ElementsAre("JavaScript: one", "JavaScript: [object Object]"));
}

TEST(Script, CannotFloodTheLog) {
    const test::CapturedLog log;
    resultOfMain("for (var i = 0; i < 10000; i++) console.log('x'.repeat(5000))");
    EXPECT_EQ(log.messages().size(), 101U);
    EXPECT_LT(log.messages()[0].size(), 5000U);
}

TEST(Script, WithoutADocumentTheResultIsEmpty) {
    EXPECT_EQ(QVCTJavaScriptUtilities::tagsForXMLDocument(nullptr, "for (;;);"), PropertyList::Array{});
}

TEST(Script, WithoutEndIsStoppedAndTheNextOneRuns) {
    const Limits limits({milliseconds(150), std::size_t{256} << 20});
    for (const char* script :
         {"for (;;);", "function main() { for (;;); }",
          "function main() { return [{get label() { for (;;); }}] }", "throw {toString() { for (;;); }}",
          "function main() { try { for (;;); } finally { for (;;); } }",
          "function main() { for (;;) try { for (;;); } catch (e) {} }",
          "function main() { for (;;) document.JSONString() }",
          "function main() { for (;;) /a/.test('ba') }"}) {
        const test::CapturedLog log;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(resultOf(script), "nil") << script;
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5)) << script;
        EXPECT_THAT(log.messages(), ElementsAre("JavaScript Exception: stopped after 150 ms")) << script;
        EXPECT_EQ(resultOfMain("return [1]"), "[1]");
    }
}

TEST(Script, TimeIsThatOfTheExpressionsThatItAsksFor) {
    std::string xml = "<P>";
    for (int i = 0; i < 2000; ++i) xml += "<a n='" + std::to_string(i) + "'/>";
    const auto document = QVCTXMLDocument::initWithXMLData(xml + "</P>", "test.xml");
    const char* const expression = "/P[count(//a[@n = //a/@n][position() < 3]) = 2]";
    const std::string script = std::string("function main() { return [document.JSONStringForXPath('") +
                               expression + "') !== null] }";
    const test::CapturedLog log;
    {
        const Limits limits({milliseconds(40), std::size_t{64} << 20});
        const auto result = QVCTJavaScriptUtilities::tagsForXMLDocument(document, script);
        EXPECT_NE(result, PropertyList::Array{true});
    }
    EXPECT_THAT(log.messages(), testing::Contains(HasSubstr("takes too many steps in this document")));
    EXPECT_NE(document->JSONStringForXPath(expression), std::nullopt) << "kept though it was not complete";
}

TEST(Script, CannotGoOnAfterItsEnd) {
    const struct {
        const char* script;
        const char* message;
    } rows[] = {
        {"async function main() { for (;;) await 1 }", "\"async\" and \"import\" are not available"},
        {"async  function main() {}", "are not available"},
        {"function main() { (async () => { for (;;) await 1 })(); return [1] }", "are not available"},
        {"function main() { (async x => { for (;;) await 1 })(); return [1] }", "are not available"},
        {"function main() { ({async f() { for (;;) await 1 }}).f(); return [1] }", "are not available"},
        {"class A { async f() {} } function main() { return [1] }", "are not available"},
        {"class A { static async *f() {} } function main() { return [1] }", "are not available"},
        {"import('x')", "are not available"},
        {"function main() { return [`${import('x')}`] }", "are not available"},
        {"/'/; async function f() {} /'/; function main() { return [1] }", "are not available"},
        {"\\u0061sync function main() { return [1] }", "SyntaxError"},
        {"function f() { return Promise.resolve().then(f) } function main() { f(); return [1] }",
         "ReferenceError: Can't find variable: Promise"},
        {"function main() { var P = Array.fromAsync([]).constructor; function f() { P.resolve().then(f) } "
         "f(); }",
         "TypeError: Array.fromAsync is not a function"},
        {"function main() { return eval('as' + 'ync function f() { for (;;) await 1 } f()') }",
         "EvalError: not available to rules"},
        {"function main() { return new Function('return 1') }", "EvalError: not available to rules"}};
    for (const auto& row : rows) {
        const test::CapturedLog log;
        EXPECT_EQ(resultOf(row.script), "nil") << row.script;
        EXPECT_THAT(log.messages(), testing::Contains(HasSubstr(row.message))) << row.script;
    }
    const test::CapturedLog log;
    EXPECT_EQ(resultOfMain(
                  "/* import */ var asynchronous = 1, o = {async: 2, import: 3}; // async\n"
                  "return [asynchronous, o.async, o['import'], /^async$/.test('async'), '\\async', `async`]"),
              "[1,2,3,true,\"async\",\"async\"]");
    EXPECT_THAT(log.messages(), testing::IsEmpty());
}

/// Walks from the global object to all that a script can get hold of.
TEST(Script, ReachesNothingThatEscapesItsLimits) {
    const test::CapturedLog log;
    EXPECT_EQ(resultOfMain(R"js(
        var seen = new Set(), open = [globalThis, function* () {}, (function* () {})(), [].values(), new Map().entries(),
            "".matchAll(/a/g), Iterator.from([]), function () { return arguments }(), Symbol(), 1n, new Proxy({}, {})];
        var found = [], forbidden = /^(exec|test|repeat|padStart|padEnd|normalize|\[Symbol\.(match|matchAll|replace|search|split)\])$/;
        while (open.length > 0) {
            var value = open.pop();
            if (value === null || (typeof value !== "object" && typeof value !== "function") || seen.has(value)) continue;
            seen.add(value);
            var tag = Object.prototype.toString.call(value), name = typeof value === "function" ? String(value.name) : "";
            if (/async|promise|buffer|worker/i.test(tag + name) || forbidden.test(name)) found.push(tag + name);
            open.push(Object.getPrototypeOf(value));
            Reflect.ownKeys(value).forEach(function (key) {
                var property = Object.getOwnPropertyDescriptor(value, key);
                open.push(property.value, property.get, property.set);
            });
        }
        return [seen.size > 500, found])js"),
              "[true,[]]");
    EXPECT_THAT(log.messages(), IsEmpty());
}

TEST(Script, RecursionWithoutEndIsAnException) {
    const test::CapturedLog log;
    EXPECT_EQ(resultOfMain("return main()"), "nil");
    EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("RangeError: Maximum call stack size exceeded")));
}

TEST(Script, CatastrophicExpressionsAreStoppedWhateverCallsThem) {
    const Limits limits({milliseconds(200), std::size_t{256} << 20});
    const std::string text = "'a'.repeat(300)", pattern = "/a*a*a*a*a*a*b/";
    for (const std::string& use :
         {pattern + ".test(" + text + ")", pattern + ".exec(" + text + ")", text + ".match(" + pattern + ")",
          text + ".replace(" + pattern + ", '')", text + ".search(" + pattern + ")",
          text + ".split(" + pattern + ")", "[..." + text + ".matchAll(" + pattern + "g)]",
          text + ".replaceAll(" + pattern + "g, '')", text + ".match('a*a*a*a*a*a*b')",
          "/(a+)+$/.test(" + text + " + 'b')", "/^(\\w+\\s?)*$/.test(" + text + " + '!')"}) {
        const test::CapturedLog log;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(resultOfMain("return [" + use + "]"), "nil") << use;
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(5)) << use;
        EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("JavaScript Exception: "))) << use;
    }
}

TEST(Script, CannotForgeExpressionsThatTheGuardLooksAt) {
    const Limits limits({milliseconds(200), std::size_t{256} << 20});
    const std::string begin = "var r = /a*a*a*a*a*a*b/, t = 'a'.repeat(300), p = RegExp.prototype; ";
    for (const char* attack :
         {"r.exec = null; r.test(t)",
          "delete p.exec; r.test(t)",
          "p.exec = null; r.test(t)",
          "r.__defineGetter__('exec', () => null); r.test(t)",
          "Object.defineProperty(r, 'exec', {value: null}); r.test(t)",
          "Object.defineProperty(r, 'source', {value: 'a'}); r.test(t)",
          "Object.defineProperty(p, 'source', {value: 'a'}); r.test(t)",
          "Object.defineProperty(p, 'source', {get() { return 'a' }}); t.replace(r, '')",
          "Object.defineProperty(r, 'flags', {value: 'v'}); t.match(r)",
          "class R extends RegExp { exec = null; get source() { return 'a' } } new R(r).test(t)",
          "var test = p.test; Object.setPrototypeOf(r, null); test.call(r, t)",
          "var f = p[Symbol.replace]; Object.setPrototypeOf(r, null); f.call(r, t, '')",
          "r.constructor = {[Symbol.species]: function () { var c = /a*a*a*a*a*a*b/y; c.exec = null; "
          "return c }}; t.split(r)",
          "Object.defineProperty(r, 'constructor', {value: {[Symbol.species]: RegExp}}); t.split(r)",
          "r.lastIndex = 300; r.test(t)",
          "var n = 0; r = /a*a*a*a*a*a*b/g; r.lastIndex = {valueOf() { return n++ ? 0 : 300 }}; "
          "r.test(t)",
          "r.exec = null; p.test.call(new Proxy(r, {}), t)",
          "r.exec = null; Array.prototype[Symbol.iterator] = Reflect.apply = null; "
          "Function.prototype.call = Function.prototype.apply = null; r.test(t)",
          "Object.prototype.get = () => null; r.test(t)",
          "r.exec = null; Object.freeze(r); t.search(r)",
          "/a/.compile(r.source).test(t)",
          "r.exec = null; var deep = () => { try { deep() } catch (e) { r.test(t) } }; deep(); "
          "throw 0"}) {
        const test::CapturedLog log;
        const auto start = std::chrono::steady_clock::now();
        EXPECT_EQ(resultOfMain(begin + attack + "; return [1]"), "nil") << attack;
        EXPECT_LT(std::chrono::steady_clock::now() - start, std::chrono::seconds(2)) << attack;
        EXPECT_THAT(log.messages(), ElementsAre(HasSubstr("JavaScript Exception: "))) << attack;
    }
}

TEST(Script, TextsAreNotMultipliedWithoutBound) {
    const struct {
        const char *body, *result;
    } rows[] = {
        {"'ab'.repeat(1e7)", "nil"},
        {"''.padStart(2 ** 30, 'ab')", "nil"},
        {"''.padEnd(1e9)", "nil"},
        {"'\ufdfa'.repeat(2e6).normalize('NFKD')", "nil"},
        {"'ab'.repeat({n: 0, valueOf() { return this.n++ ? 1e9 : 1 }})", "[2]"},
        {"'ab'.repeat(3) + 'x'.padStart(3) + 'y'.padEnd(3, 'z') + 'e\u0301'.normalize()", "[13]"},
        {"'ab'.repeat(-1)", "nil"},
    };
    for (const auto& row : rows) {
        const test::CapturedLog log;
        EXPECT_EQ(resultOfMain(std::string("var t = (function () { return ") + row.body +
                               " })(); return [t.length]"),
                  row.result)
            << row.body;
    }
}

TEST(Script, OrdinaryExpressionsWorkAsEver) {
    EXPECT_EQ(resultOfMain("return ['x-y z'.replace(/[-\\s]+/g, '_'), 'a1b2'.match(/\\d/g).join(''), 'a, "
                           "b,c'.split(/,\\s*/), "
                           "'aXbX'.search(/x/i), /^(\\w+\\s?)+$/.test('warm analog pad '.repeat(500) + 'x'), "
                           "'2024-05'.replace(/(?<y>\\d+)-(?<m>\\d+)/, '$<m>/$<y>')]"),
              R"(["x_y_z","12",["a","b","c"],1,true,"05/2024"])");
    EXPECT_EQ(
        resultOfMain(
            "var thrown = 0; for (var f of [() => /a/.exec.call(7, 'a'), () => /a/.exec(Symbol('s')), () => "
            "/a/.exec.call({get source() { throw 1 }}, 'a')]) try { f() } catch (e) { thrown++ } "
            "return [thrown, /undefined/.test(), /a/.exec('b')]"),
        "[3,true]");
    EXPECT_EQ(resultOfMain(
                  "var r = /a/y; r.lastIndex = 1; return [r.test('ba'), r.lastIndex, /a/.exec('ba').index]"),
              "[true,2,1]");
}

TEST(RegularExpressionGuard, WritesPatternsAsTheOtherEngineReadsThem) {
    const struct {
        const char16_t *pattern, *icu;
    } rows[] = {{u"a$", u"a\\z"},
                {u"[$[&&]", u"[$\\[\\&\\&]"},
                {u"\\d[\\w\\D]", u"[0-9][[A-Za-z0-9_][^0-9]]"},
                {u"[]a[^]", u"(?!)a[\\s\\S]"},
                {u"\\b[\\b]", u"\\b[\\x08]"},
                {u"\\u{1F3B5}\\u0041", u"\\x{1F3B5}\\u0041"},
                {u"\\$\\[", u"\\$\\["}};
    for (const auto& row : rows) EXPECT_EQ(icuPattern(row.pattern, false), row.icu);
    EXPECT_EQ(icuPattern(u"a$", true), u"a$");
}

TEST(Script, MemoryWithoutEndIsStopped) {
    const Limits limits({milliseconds(20000), std::size_t{64} << 20});
    const test::CapturedLog log;
    EXPECT_EQ(resultOf("var a = []; for (;;) a.push(1);"), "nil");
    EXPECT_EQ(resultOf("var a = []; for (;;) a.push({x: [1, 2, 3]});"), "nil");
    EXPECT_THAT(log.messages(), testing::Each("JavaScript Exception: stopped at more than 64 MiB of memory"));
    EXPECT_EQ(log.messages().size(), 2U);
}

TEST(Script, EachThreadHasItsOwnMachine) {
    std::vector<std::thread> threads;
    std::vector<std::string> results(4);
    for (std::string& result : results) {
        threads.emplace_back([&result] {
            for (int i = 0; i < 50; ++i) result = resultOfMain("return [document.isMatchingXPath('/P/a')]");
        });
    }
    for (std::thread& thread : threads) thread.join();
    EXPECT_THAT(results, testing::Each("[true]"));
}

TEST(Script, SyntaxIsCheckedWithoutRunning) {
    Error error;
    EXPECT_TRUE(ScriptContext::checkSyntax("for (;;);"));
    EXPECT_FALSE(ScriptContext::checkSyntax("var a;\nvar b = ;", &error));
    EXPECT_THAT(error.message(), HasSubstr("script, line 2: SyntaxError"));
}

}  // namespace
}  // namespace qvct
