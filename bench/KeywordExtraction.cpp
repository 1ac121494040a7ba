// Keyword extraction beside its definition, one expression per keyword: the same results, and how much
// faster.

#include "Measure.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "support/OneByOneExtractor.h"
#include "support/PathGenerator.h"

#include <fstream>
#include <string>
#include <vector>

namespace {

using namespace qvct;

std::vector<std::string> presetNames() {
    std::vector<std::string> names;
    std::ifstream file(std::string(QVCT_CORPUS) + "/names/presets.tsv");
    for (std::string line; std::getline(file, line);)
        names.push_back("file:///Library/" + line.substr(0, line.find('\t')));
    if (!names.empty()) names.erase(names.begin());  // the heading
    return names;
}

std::vector<std::string> generatedPaths(const QVCTKeywordExtractor& extractor, std::size_t count) {
    test::PathGenerator generator(extractor);
    std::vector<std::string> paths;
    for (std::size_t i = 0; i < count; ++i) paths.push_back(generator.next());
    return paths;
}

void compare(std::string_view what, const std::vector<std::string>& paths, QVCTKeywordExtractor& extractor,
             std::size_t repetitions) {
    test::OneByOneExtractor reference(extractor);
    std::size_t differences = 0;
    std::size_t labels = 0;
    const auto both = [&] {
        for (const std::string& path : paths) {
            const CountedSet found = extractor.extractKeywordsFromString(path);
            labels += found.size();
            if (!(found == reference.extract(path))) ++differences;
        }
    };
    both();
    const auto perPath = [&](auto extract) {
        return bench::medianSeconds(
                   [&] {
                       for (const std::string& path : paths) bench::keep(extract(path));
                   },
                   repetitions) /
               static_cast<double>(paths.size());
    };
    const double fast =
        perPath([&](const std::string& path) { return extractor.extractKeywordsFromString(path); });
    const double slow = perPath([&](const std::string& path) { return reference.extract(path); });
    bench::printRow(fmt::format("{}: {} paths, {:.1f} labels each", what, paths.size(),
                                static_cast<double>(labels) / static_cast<double>(paths.size())),
                    fmt::format("{} differences", differences), "0");
    bench::printRow("  one expression per keyword", fmt::format("{:.1f} us a path", slow * 1e6), "");
    bench::printRow("  scanned", fmt::format("{:.2f} us, {:.0f}/s", fast * 1e6, 1 / fast), "400,000/s");
    bench::printRow("  ratio", fmt::format("{:.0f}", slow / fast), "at least 100, aim 300");
}

}  // namespace

int main() {
    const auto extractor = QVCTKeywordExtractor::defaultKeywordExtractor();
    if (const auto names = presetNames(); names.empty()) {
        fmt::print("no corpus of preset names here\n");
    } else {
        compare("preset names", names, *extractor, 7);
    }
    constexpr std::size_t enoughToTellDifferences = 100000;
    compare("generated, 1 in 4 with other scripts", generatedPaths(*extractor, enoughToTellDifferences),
            *extractor, 1);
    return 0;
}
