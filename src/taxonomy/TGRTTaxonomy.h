#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/base/Object.h"
#include "platform/base/ObjectSet.h"
#include "platform/data/PropertyList.h"
#include "platform/text/Url.h"
#include "taxonomy/TGRTCategory.h"
#include "taxonomy/TGRTTag.h"
#include "taxonomy/labels/OptionalLabel.h"

#include <cstddef>
#include <cstdint>
#include <initializer_list>
#include <map>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

struct LabelKey;
class TGRTTagging;

/// Which resource a taxonomy is built from. Other numbers name none and give an empty taxonomy.
enum TaxonomyType : std::int64_t {
    kDefaultTaxonomy = 0,
    kLegacyVorthalTaxonomy = -1,  ///< the retired vocabulary of synth presets
    kLegacyLoopTaxonomy = -2      ///< the retired vocabulary of loops
};

/// What a host sees of a taxonomy.
class QVCT_API QVContentTaggingTaxonomy {
  public:
    using Localization = std::map<std::string, std::string>;

    virtual ~QVContentTaggingTaxonomy() = default;
    /// A copy, which outlives the taxonomy.
    virtual ObjectSet<TGRTCategory> categories() const = 0;
    virtual Localization localizationDictionary() const = 0;
    virtual std::string localizedStrings() const = 0;
    /// Writes the property list. False, and an error, when it cannot be written: to a URL that is no file's,
    /// or with tags nested so deep that the property list would exceed kDeepestPropertyList.
    virtual bool writeToURL(const URL& url, Error* error = nullptr) const = 0;
    virtual std::string serializedTaxonomyData() const = 0;
};

/// The catalogue of all tags: categories, each with a tree of tags.
///
/// Looking up is safe from several threads as long as nobody adds tags; code that adds tags to a taxonomy
/// that other threads use must make sure that only one thread uses it at a time. Cached taxonomies live as
/// long as the cache or a caller keeps them; tags do not keep their taxonomy alive.
///
/// Labels are compared as they are, case included, and without markers ("Bright / Dark", not "Bright /
/// Dark-+").
class QVCT_API TGRTTaxonomy : public Object, public QVContentTaggingTaxonomy {
  public:
    using TagPointer = std::shared_ptr<TGRTTag>;
    using CategoryPointer = std::shared_ptr<TGRTCategory>;
    using OptionalLabel = qvct::OptionalLabel;

    // Obtaining one.

    /// Read-only, shared.
    static std::shared_ptr<TGRTTaxonomy> defaultTaxonomy();
    /// Writable and shared: whoever adds a tag adds it for everybody.
    static std::shared_ptr<TGRTTaxonomy> mutableDefaultTaxonomy();
    /// Writable, a new one each time.
    static std::shared_ptr<TGRTTaxonomy> testingTaxonomy();
    /// The retired vocabulary of synth presets; read-only, shared.
    static std::shared_ptr<TGRTTaxonomy> legacyVorthalTaxonomy();
    /// The retired vocabulary of loops; read-only, shared.
    static std::shared_ptr<TGRTTaxonomy> legacyLoopTaxonomy();
    /// From the resource file of the type where there is one, else from the compiled-in copy.
    static std::shared_ptr<TGRTTaxonomy> newTaxonomyOfType(std::int64_t type, bool readonly, bool useCache);
    /// The resource file of the type; nothing when the compiled-in copy is used.
    static std::optional<URL> taxonomyURLForType(std::int64_t type);
    /// The property list that `newTaxonomyOfType` builds from; nothing for a type without one.
    static std::optional<PropertyList::Dictionary> taxonomyDictionaryForType(std::int64_t type);
    /// An empty taxonomy, and an error, when the file cannot be read.
    static std::shared_ptr<TGRTTaxonomy> taxonomyWithContentsOfURL(const URL& url, Error* error = nullptr);
    /// @{
    /// Null, and an error, when the bytes are not a property list; null without an error when it is not a
    /// dictionary.
    static std::shared_ptr<TGRTTaxonomy> taxonomyWithData(std::span<const std::uint8_t> data,
                                                          Error* error = nullptr);
    static std::shared_ptr<TGRTTaxonomy> taxonomyWithData(std::string_view data, Error* error = nullptr);
    /// @}
    /// The taxonomy of a property list's dictionary. Entries of the wrong type are passed over. Never null.
    static std::shared_ptr<TGRTTaxonomy> taxonomyWithDictionary(const PropertyList::Dictionary& dictionary);
    /// An empty, writable one.
    static std::shared_ptr<TGRTTaxonomy> init();
    /// Drops the cached taxonomies, as a host does when memory runs short.
    static void evictCache();

    // Building.

    /// Creates the tags of a dictionary of labels, siblings in the order of the user's locale; all of them,
    /// each before its children.
    static std::vector<TagPointer> tagsFromDictionary(const PropertyList::Dictionary& dictionary,
                                                      const TagPointer& parentTag,
                                                      const CategoryPointer& category);
    /// Creates a tag for each string of the array, without children; otherwise as above.
    static std::vector<TagPointer> tagsFromArray(const PropertyList::Array& array,
                                                 const TagPointer& parentTag,
                                                 const CategoryPointer& category);
    /// The raw labels in the order of siblings: by their sorting prefix, then as the user's locale sorts.
    static std::vector<std::string> sortedTagLabelsFromArray(std::vector<std::string> labels);

    bool readOnly() const { return readOnly_; }
    void setReadOnly(bool readOnly) { readOnly_ = readOnly; }
    ObjectSet<TGRTCategory> categories() const override { return categories_; }
    /// Ignored when read-only.
    void addCategory(const CategoryPointer& category);
    /// The category, made when it is not there. Null when it would have to be made in a read-only taxonomy.
    CategoryPointer findOrCreateCategoryWithIdentifier(std::string_view identifier,
                                                       bool overwriteReadonly = false);
    /// @{
    /// The tag with that label at any depth of the category; else a new one below the parent label (a root
    /// tag when no such parent is found). Null when it would have to be made in a read-only taxonomy.
    TagPointer findOrCreateTagWithLabel(std::string_view label, std::string_view categoryIdentifier);
    TagPointer findOrCreateTagWithLabel(std::string_view label, OptionalLabel parentLabel,
                                        std::string_view categoryIdentifier, bool overwriteReadonly = false);
    template <typename... Others>
    TagPointer findOrCreateTagWithLabel(std::nullptr_t, Others...) = delete;
    TagPointer findOrCreateTagWithLabel(std::string_view label, std::nullptr_t) = delete;
    TagPointer findOrCreateTagWithLabel(std::string_view label, OptionalLabel parentLabel, std::nullptr_t,
                                        bool overwriteReadonly = false) = delete;
    /// @}
    /// Adds the content pack even to a read-only taxonomy. Null for an empty identifier.
    TagPointer findOrCreateSoundPackTagWithIdentifier(std::string_view identifier);

    // Finding. @cost O(1) for a label that its category has once; a walk over the tree for others.

    /// The category, or null.
    CategoryPointer findCategoryWithIdentifier(std::string_view identifier) const;
    CategoryPointer findCategoryWithIdentifier(std::nullptr_t) const = delete;
    /// @{
    /// The first tag with the label: below the parent with that label, in the category, or anywhere. Null
    /// when there is none.
    TagPointer findTagForLabel(std::string_view label) const;
    TagPointer findTagForLabel(std::string_view label, std::string_view categoryIdentifier) const;
    TagPointer findTagForLabel(std::string_view label, OptionalLabel parentLabel,
                               std::string_view categoryIdentifier) const;
    template <typename... Others>
    TagPointer findTagForLabel(std::nullptr_t, Others...) const = delete;
    TagPointer findTagForLabel(std::string_view label, std::nullptr_t) const = delete;
    TagPointer findTagForLabel(std::string_view label, OptionalLabel parentLabel,
                               std::nullptr_t) const = delete;
    /// @}
    /// Depth first, in order; a tag with the label under another parent is passed over with its children.
    static TagPointer findTagWithLabel(std::string_view label, OptionalLabel parentLabel,
                                       const ObjectSet<TGRTTag>& tags);
    /// Whether the tag's category has an equal tag. False for null.
    bool doesContainTag(const TagPointer& tag) const;
    std::vector<TagPointer> allTags() const;
    /// @{
    /// The tags of this taxonomy that the taggings name, in one category or in all.
    ObjectSet<TGRTTag> tagsForTaggings(const ObjectSet<TGRTTagging>& taggings,
                                       OptionalLabel categoryIdentifier,
                                       bool includingAncestors = false) const;
    ObjectSet<TGRTTag> tagsForTaggings(const std::vector<std::shared_ptr<TGRTTagging>>& taggings,
                                       OptionalLabel categoryIdentifier,
                                       bool includingAncestors = false) const;
    ObjectSet<TGRTTag> tagsForTaggings(std::initializer_list<std::shared_ptr<TGRTTagging>> taggings,
                                       OptionalLabel categoryIdentifier,
                                       bool includingAncestors = false) const;
    /// @}
    /// Adds the tag that the tagging names, if this taxonomy has it, and its ancestors if asked for.
    void appendTagsOfTagging(const TGRTTagging& tagging, ObjectSet<TGRTTag>& set,
                             bool includingAncestors) const;
    /// Changes whenever a category or tag was added, moved or renamed.
    std::uint64_t revision() const;

    // Writing.

    PropertyList::Dictionary dictionary() const;
    bool writeToURL(const URL& url, Error* error = nullptr) const override;
    /// The binary property list; empty on failure.
    std::string serializedTaxonomyData() const override;
    /// Keys and display strings for a host's translation. With the user default "fakeLocalization" most
    /// strings are reversed, so that untranslated ones stand out.
    Localization localizationDictionary() const override;
    /// The same as the text of a strings table. Quotes, backslashes and line breaks are escaped.
    std::string localizedStrings() const override;
    /// Rows, header first, of a table in which a mapping of retired tags can be filled in.
    std::vector<std::string> mappingExport() const;
    /// The row for one tag.
    std::string mappingExportForTag(const TGRTTag& tag) const;
    std::string description() const override;

  private:
    TGRTTaxonomy() = default;
    static TagPointer findInCategory(const TGRTCategory& category, const LabelKey& label,
                                     OptionalLabel parentLabel);

    ObjectSet<TGRTCategory> categories_;
    bool readOnly_ = false;
};

}  // namespace qvct
