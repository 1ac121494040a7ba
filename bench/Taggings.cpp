// Property lists of taggings beside their parsing alone, the default taxonomy from its property list, and
// looking up labels.

#include "Measure.h"
#include "platform/data/PropertyListFile.h"
#include "resources/EmbeddedFiles.h"
#include "resources/QVCTCompiledResources.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <span>
#include <string>
#include <vector>

namespace {

using namespace qvct;

/// Seconds of one of many calls.
template <typename Work>
double perCall(std::size_t calls, Work work) {
    return bench::medianSeconds(
               [&] {
                   for (std::size_t i = 0; i < calls; ++i) bench::keep(work(i));
               },
               15) /
           static_cast<double>(calls);
}

/// Tags from all over the taxonomy, every other one with a level.
PropertyList::Dictionary hundredTaggings() {
    const auto tags = TGRTTaxonomy::defaultTaxonomy()->allTags();
    ObjectSet<TGRTTagging> taggings;
    for (std::size_t i = 0; i < 100; ++i) {
        taggings.insert(TGRTTagging::initWithTag(
            tags[i * tags.size() / 100],
            i % 2 == 0 ? TGRTLevel::levelWithWeight(static_cast<double>(i) / 100) : nullptr));
    }
    return TGRTTagging::taggingDictionaryForTaggings(taggings);
}

void measureTaggings(PropertyListFormat format, std::string_view name) {
    const std::string bytes = serializePropertyList(hundredTaggings(), format);
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    constexpr std::size_t calls = 200;
    const double parse = perCall(calls, [&](std::size_t) { return parsePropertyList(bytes); });
    const double whole = perCall(calls, [&](std::size_t) {
        const auto list = parsePropertyList(bytes);
        return TGRTTagging::taggingsWithTaggingDictionary(&*list, *taxonomy).size();
    });
    const auto list = parsePropertyList(bytes);
    const std::size_t count = TGRTTagging::taggingsWithTaggingDictionary(&*list, *taxonomy).size();
    bench::printRow(fmt::format("{} property list of {} taggings: parsed", name, count),
                    fmt::format("{:.1f} us", parse * 1e6), "");
    bench::printRow("  and turned into taggings", fmt::format("{:.1f} us", whole * 1e6), "");
    bench::printRow("  ratio", fmt::format("{:.2f}", whole / parse), "at most 2");
}

void measureTaxonomy() {
    const std::span<const unsigned char> bytes(DefaultTaxonomy_plist, DefaultTaxonomy_plist_len);
    const auto build = [&] { bench::keep(TGRTTaxonomy::taxonomyWithData(bytes)); };
    const double cold = bench::medianSeconds(build, 1);
    const double parse = bench::medianSeconds([&] { bench::keep(parsePropertyList(bytes)); }, 15);
    const double warm = bench::medianSeconds(build, 15);
    bench::printRow("default taxonomy from its property list, cold", fmt::format("{:.2f} ms", cold * 1e3),
                    "under 5 ms");
    bench::printRow("  again", fmt::format("{:.2f} ms", warm * 1e3), "");
    bench::printRow("  parsing alone", fmt::format("{:.2f} ms", parse * 1e3), "");
}

void measureLookups(TGRTTaxonomy& taxonomy, std::string_view name) {
    struct Wanted {
        std::string label, parent, category;
    };
    std::vector<Wanted> wanted;
    for (const auto& tag : taxonomy.allTags()) {
        const auto parent = tag->parent();
        wanted.push_back({tag->label(), parent ? parent->label() : "", tag->categoryIdentifier()});
    }
    constexpr std::size_t calls = 100000;
    const auto each = [&](auto find) {
        return perCall(calls, [&](std::size_t i) { return find(wanted[i % wanted.size()]); });
    };
    const double full = each([&](const Wanted& w) {
        return taxonomy.findTagForLabel(w.label, w.parent.empty() ? TGRTTaxonomy::OptionalLabel() : w.parent,
                                        w.category);
    });
    const double byLabel = each([&](const Wanted& w) { return taxonomy.findTagForLabel(w.label); });
    double slowest = 0;
    for (const Wanted& w : wanted) {
        slowest = std::max(slowest, perCall(50, [&](std::size_t) {
                               return taxonomy.findTagForLabel(
                                   w.label, w.parent.empty() ? TGRTTaxonomy::OptionalLabel() : w.parent,
                                   w.category);
                           }));
    }
    const double searched = each([&](const Wanted& w) {
        return TGRTTaxonomy::findTagWithLabel(w.label,
                                              w.parent.empty() ? TGRTTaxonomy::OptionalLabel() : w.parent,
                                              taxonomy.findCategoryWithIdentifier(w.category)->tags());
    });
    bench::printRow(fmt::format("{}: {} tags, by label, parent and category", name, wanted.size()),
                    fmt::format("{:.0f} ns", full * 1e9), "under 1000 ns");
    bench::printRow("  the slowest label", fmt::format("{:.0f} ns", slowest * 1e9), "");
    bench::printRow("  by label alone", fmt::format("{:.0f} ns", byLabel * 1e9), "");
    bench::printRow("  searching the tree", fmt::format("{:.0f} ns", searched * 1e9), "");
}

}  // namespace

int main() {
    measureTaxonomy();  // first, while nothing is warm
    measureTaggings(PropertyListFormat::binary, "binary");
    measureTaggings(PropertyListFormat::xml, "XML");
    measureLookups(*TGRTTaxonomy::defaultTaxonomy(), "default taxonomy");
    measureLookups(*TGRTTaxonomy::legacyVorthalTaxonomy(), "retired taxonomy, labels under many parents");
    return 0;
}
