#pragma once

#include "formats/TGRTMetaDataReaderFactory.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyListFile.h"
#include "platform/text/Url.h"
#include "support/TemporaryFolder.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

namespace qvct::test {

using Dictionary = PropertyList::Dictionary;

inline URL urlOf(const std::string& path) {
    return URL::fileURLWithPath(path);
}

/// The item's record, as the reader of its extension reads it.
inline std::shared_ptr<TGRTMetaData> read(const std::string& path, std::uint64_t options = 0,
                                          Error* error = nullptr) {
    return TGRTMetaDataReaderFactory::metaDataReaderForURL(urlOf(path))
        ->readMetaDataFromURL(urlOf(path), options, error);
}

/// Taggings of tags of the default taxonomy, or of new ones.
inline ObjectSet<TGRTTagging> taggingsOf(
    const std::vector<std::pair<std::string_view, std::string_view>>& categoriesAndLabels,
    std::optional<double> level = {}) {
    static const auto taxonomy = TGRTTaxonomy::testingTaxonomy();
    ObjectSet<TGRTTagging> taggings;
    for (const auto& [category, label] : categoriesAndLabels) {
        taggings.insert(TGRTTagging::initWithTag(taxonomy->findOrCreateTagWithLabel(label, category),
                                                 level ? TGRTLevel::levelWithWeight(*level) : nullptr));
    }
    return taggings;
}

/// "Category/Label" or "Category/Label=0.5" of each.
inline std::set<std::string> textsOf(const ObjectSet<TGRTTagging>& taggings) {
    std::set<std::string> texts;
    for (const auto& tagging : taggings) {
        std::string text = tagging->category() + "/" + tagging->label();
        if (tagging->level()) text += "=" + std::to_string(tagging->level()->weight()).substr(0, 4);
        texts.insert(text);
    }
    return texts;
}

inline std::string writeList(const TemporaryFolder& folder, std::string_view name,
                             const Dictionary& dictionary,
                             PropertyListFormat format = PropertyListFormat::xml) {
    return folder.write(name, serializePropertyList(dictionary, format));
}

/// A tagging dictionary of one tag.
inline Dictionary taggingDictionary(const char* category, const char* label) {
    return {{category, PropertyList::Array{Dictionary{{"Name", label}}}}};
}

}  // namespace qvct::test
