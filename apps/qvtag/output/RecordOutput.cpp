#include "output/RecordOutput.h"

#include "formats/QVContentTaggingTypes.h"
#include "output/PropertyListOutput.h"
#include "output/StandardStreams.h"
#include "platform/text/Text.h"

#include <fmt/format.h>

namespace qvct::tool {

void printField(const Terminal& terminal, std::string_view name, const std::vector<Word>& words) {
    constexpr std::size_t width = 22;
    if (words.empty()) return;
    print("  {}{}\n", colored(terminal, Color::faint, padded(name, width - 2)),
          wrapped(terminal, words, width));
}

void printTaggings(const Terminal& terminal, const ObjectSet<TGRTTagging>& taggings) {
    std::vector<Word> words;
    std::string category;
    const auto flush = [&] {
        printField(terminal, printable(category), words);
        words.clear();
    };
    for (const auto& tagging : sortedTaggings(taggings)) {
        if (tagging->category() != category) flush();
        category = tagging->category();
        words.push_back({textOfTagging(*tagging), tagging->level() ? Color::accent : Color::plain});
    }
    flush();
}

void printKeyValues(const Terminal& terminal, const ObjectSet<TGRTKeyValue>& keyValues) {
    std::vector<Word> words;
    for (const auto& keyValue : keyValues) {
        words.push_back({fmt::format("{} {}", printable(keyValue->key()),
                                     textOfPropertyList(keyValue->value().value_or(PropertyList("")))),
                         Color::plain});
    }
    printField(terminal, "values", words);
}

void printKind(const Terminal& terminal, std::int64_t fileType, std::int64_t subFileType) {
    std::string kind(QVContentTaggingTypes::nameForFileType(fileType));
    if (subFileType > 0) kind += fmt::format(", sub type {}", subFileType);
    printField(terminal, "kind", {{kind, Color::plain}});
}

}  // namespace qvct::tool
