// The default rules: against evaluating each rule by itself, and what one item costs.

#include "Measure.h"
#include "autotagging/scripts/QVCTJavaScriptUtilities.h"
#include "autotagging/services/QVCTXMLRulesTaggingService.h"
#include "autotagging/xml/QVCTXMLDocument.h"
#include "autotagging/xml/XPathExpression.h"

#include <cstdio>
#include <cstdlib>
#include <thread>

#include <JavaScriptCore/JavaScript.h>

using namespace qvct;

namespace {

/// A patch of three channels with eight plug-ins each, as many parameters as asked for.
std::string patchDescription(std::size_t parameters) {
    const char* const names[] = {"Tinewick", "Channel EQ",  "Compressor", "Tape Delay",
                                 "Chorus",   "Arpeggiator", "Amp",        "Reverb"};
    const std::size_t perPlugIn = parameters / 24;
    std::string xml = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<Patch>\n<Channels>\n";
    for (int channel = 0; channel < 3; ++channel) {
        xml += "<Channel mode=\"Stereo\" type=\"Audio\"><Plugins>\n";
        for (const char* name : names) {
            xml +=
                fmt::format("<Plugin name=\"{}\" bypassed=\"0\" settingName=\"Init\"><Parameters>\n", name);
            for (std::size_t i = 0; i < perPlugIn; ++i) {
                xml += fmt::format("<Parameter name=\"Parameter {}\" value=\"{}\" valueString=\"{} ms\"/>\n",
                                   i, static_cast<double>(i) / 4, i);
            }
            xml += "</Parameters></Plugin>\n";
        }
        xml += "</Plugins></Channel>\n";
    }
    return xml + "</Channels>\n</Patch>\n";
}

std::string textOf(const PropertyList& rule, std::string_view key) {
    const PropertyList* value = rule.dictionary()->value(key);
    return value == nullptr ? std::string{} : *value->string();
}

/// Each rule by itself: the expression compiled and all its nodes written out, the script in a virtual
/// machine of its own (that of a new thread, which has none yet).
void evaluateEachAlone(const PropertyList::Array& rules, const std::shared_ptr<QVCTXMLDocument>& document) {
    for (const PropertyList& rule : rules) {
        const std::string text = textOf(rule, "rule");
        if (textOf(rule, "type") == "JavaScript") {
            std::thread([&] {
                bench::keep(QVCTJavaScriptUtilities::tagsForXMLDocument(document, text));
            }).join();
        } else {
            bench::keep(XPathExpression::compile(text));
            bench::keep(document->nodesForXPath(text));
        }
    }
}

long residentKilobytes() {
    long pages = 0, resident = 0;
    std::FILE* file = std::fopen("/proc/self/statm", "r");
    if (file != nullptr && std::fscanf(file, "%ld %ld", &pages, &resident) != 2) resident = 0;
    if (file != nullptr) std::fclose(file);
    return resident * 4;
}

double milliseconds(double seconds) {
    return seconds * 1e3;
}

void compareOnLargePatch(const PropertyList::Array& rules, QVCTXMLRulesTaggingService& service) {
    constexpr std::size_t kRepetitions = 41;
    const std::string xml = patchDescription(3000);
    const URL url = URL::fileURLWithPath("/bench.patch");
    // Documents keep what scripts ask of them, so each evaluation gets one of its own.
    const auto parsed = [&xml] { return QVCTXMLDocument::initWithXMLData(xml, "bench"); };
    const double alone = bench::medianSecondsOn(
        parsed, [&](const auto& document) { evaluateEachAlone(rules, document); }, kRepetitions);
    const double together = bench::medianSecondsOn(
        parsed,
        [&](const auto& document) {
            bench::keep(service.tagsWithContentsOfURL(url, document, nullptr, nullptr,
                                                      QVCTAutoTaggingOptionXMLRules));
        },
        kRepetitions);
    bench::printRow(fmt::format("default rules over {} KB, each rule alone", xml.size() / 1000),
                    fmt::format("{:.2f} ms", milliseconds(alone)), "");
    bench::printRow("default rules over the same, as one set",
                    fmt::format("{:.2f} ms = {:.1f} times", milliseconds(together), alone / together),
                    "5 times faster");
}

void measureItem(const PropertyList::Array& rules, QVCTXMLRulesTaggingService& service) {
    const std::string xml = patchDescription(150);
    const URL url = URL::fileURLWithPath("/bench.patch");
    const auto document = QVCTXMLDocument::initWithXMLData("<Patch/>", "bench");
    // The engine collects its garbage in threads of its own: what an item waits for is on the clock.
    const auto printTimes = [](std::string_view what, const char* target, auto work) {
        constexpr std::size_t repetitions = 401;
        const double clock = bench::medianSeconds(work, repetitions, bench::clockTime);
        const double processor = bench::medianSeconds(work, repetitions);
        bench::printRow(
            what, fmt::format("{:.3f} ms, processor {:.3f} ms", milliseconds(clock), milliseconds(processor)),
            target);
    };
    const JSContextGroupRef group = JSContextGroupCreate();
    printTimes("five empty contexts of the engine, made and given back", "", [&] {
        for (int i = 0; i < 5; ++i) JSGlobalContextRelease(JSGlobalContextCreateInGroup(group, nullptr));
    });
    JSContextGroupRelease(group);
    printTimes("five script contexts of one item", "0.7 ms", [&] {
        for (const PropertyList& rule : rules) {
            if (textOf(rule, "type") != "JavaScript") continue;
            bench::keep(QVCTJavaScriptUtilities::tagsForXMLDocument(document, textOf(rule, "rule")));
        }
    });
    printTimes(fmt::format("a patch of {:.1f} KB, parsed and tagged", static_cast<double>(xml.size()) / 1000),
               "1 ms", [&] {
                   const auto parsed = QVCTXMLDocument::initWithXMLData(xml, "bench");
                   bench::keep(service.tagsWithContentsOfURL(url, parsed, nullptr, nullptr,
                                                             QVCTAutoTaggingOptionXMLRules));
               });
}

void measureMemory() {
    const auto document = QVCTXMLDocument::initWithXMLData("<Patch/>", "bench");
    const auto evaluate = [&](int times) {
        for (int i = 0; i < times; ++i) {
            bench::keep(QVCTJavaScriptUtilities::tagsForXMLDocument(
                document, "function main() { return [{label: 'a' + document.JSONString()}]; }"));
        }
        return residentKilobytes();
    };
    const long early = evaluate(10000), late = evaluate(90000);
    bench::printRow("memory after 100,000 evaluations, and after 10,000",
                    fmt::format("{} KB, {} KB", late, early), "at most 5 % more");
}

}  // namespace

int main(int count, char** /*values*/) {
    const PropertyList::Dictionary rules = QVCTXMLRulesTaggingService::defaultRules();
    const PropertyList::Array& list = *rules.value("DefaultRules")->array();
    const auto service = QVCTXMLRulesTaggingService::init();
    measureItem(list, *service);
    compareOnLargePatch(list, *service);
    if (count > 1) measureMemory();
    return EXIT_SUCCESS;
}
