// What names say: reading them, deciding what holds, and both, beside the keyword extraction that reads the
// same paths.
#include "Measure.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/keywords/QVCTKeywordExtractor.h"
#include "autotagging/names/NameReader.h"
#include "support/PathGenerator.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <string>
#include <vector>

namespace {

using namespace qvct;

constexpr std::size_t kPaths = 20'000;

std::vector<std::string> generatedPaths(const QVCTKeywordExtractor& extractor) {
    test::PathGenerator generator(extractor);
    std::vector<std::string> paths;
    for (std::size_t i = 0; i < kPaths; ++i)
        paths.push_back(generator.next().substr(std::string_view("file://").size()));
    return paths;
}

template <typename Work>
double secondsEach(const std::vector<std::string>& paths, Work work) {
    return bench::medianSeconds([&] {
               for (const std::string& path : paths) bench::keep(work(path));
           }) /
           static_cast<double>(paths.size());
}

void print(std::string_view what, double seconds, std::string_view target) {
    bench::printRow(what, fmt::format("{:.2f} us, {:.0f}/s", seconds * 1e6, 1 / seconds), target);
}

}  // namespace

int main() {
    const std::string root = "/Users/producer/Music/Sound Library";
    const auto taxonomy = TGRTTaxonomy::defaultTaxonomy();
    const auto extractor = QVCTKeywordExtractor::defaultKeywordExtractor();
    const std::vector<std::string> paths = generatedPaths(*extractor);
    NameReader reader;
    const ClaimResolver resolver(taxonomy);
    ItemTagger tagger(QVTaggingAggregator::defaultTaggingAggregator(), taxonomy);
    const auto read = [&](const std::string& path) { return reader.read(ItemNames(path, root).all()); };
    std::size_t claims = 0;
    for (const std::string& path : paths) claims += read(path).claims.size();

    const double reading = secondsEach(paths, read);
    const double both = secondsEach(paths, [&](const std::string& path) {
        return resolver.resolve(read(path).claims, SoundKind::oneShot).held.size();
    });
    print(fmt::format("names of generated paths, {:.1f} claims each: read",
                      static_cast<double>(claims) / kPaths),
          reading, "at most 5 us");
    print("  decided", both - reading, "at most 10 us");
    print(
        "  tagged by names alone",
        secondsEach(
            paths,
            [&](const std::string& path) {
                return tagger.reportOfNames(ItemNames(path, root), SoundKind::oneShot).resolution.held.size();
            }),
        "50,000/s");
    print("  their keywords extracted",
          secondsEach(
              paths,
              [&](const std::string& path) { return extractor->extractKeywordsFromString(path).size(); }),
          "");
}
