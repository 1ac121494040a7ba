#pragma once

#include "autotagging/services/QVCTAutoTaggingService.h"
#include "platform/base/Export.h"
#include "platform/data/PropertyList.h"

#include <chrono>
#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace qvct {

/// A rule of a rule set, as it stands there.
struct RuleDescription {
    std::size_t number = 0;  ///< From 1, in the order of the rule set.
    std::string type;        ///< "XPath", "JavaScript", or whatever else was written.
    /// What keeps the rule from ever giving a tag; empty when nothing does.
    std::string problem;
};

/// The outcome of one rule for one document.
struct RuleOutcome {
    std::size_t number = 0;  ///< From 1, in the order of the rule set.
    std::string type;        ///< "XPath" or "JavaScript".
    std::vector<TagDictionary> tags;
    /// Why: the first node's XML, or the script's result as JSON. Empty when the rule gives no tag.
    std::string evidence;
    std::chrono::nanoseconds time{0};
};

/// Tags an item by rules that look into its XML description.
///
/// A rule set is a dictionary whose "DefaultRules" is an array of rules, each a dictionary: "rule" (an XPath
/// expression or a script, or "file://" and the path of a file that holds it), "tag" (the label that an XPath
/// rule gives) and "type" ("XPath", which may be left out, or "JavaScript"; anything else disables the rule).
/// Rules without effect are passed over silently; `rules` tells why.
///
/// Immutable: safe from every thread, each with documents of its own.
class QVCT_API QVCTXMLRulesTaggingService : public QVCTAutoTaggingService {
  public:
    /// With the default rules.
    static std::shared_ptr<QVCTXMLRulesTaggingService> init();
    /// Without rules the default ones.
    static std::shared_ptr<QVCTXMLRulesTaggingService> initWithRules(
        std::optional<PropertyList::Dictionary> rules);

    /// The rules of the resource folder, else those inside the library.
    static PropertyList::Dictionary defaultRules();

    /// The tags of all rules in their order. Only the XML document is looked at.
    /// @cost  Default rules: about a millisecond for an ordinary patch, mostly for the five scripts.
    TagDictionarySet tagsWithContentsOfURL(const URL& url,
                                           const std::shared_ptr<QVCTXMLDocument>& xmlDocument,
                                           const std::shared_ptr<TGRTMetaData>& metaData,
                                           const std::shared_ptr<LCFileData>& fileData,
                                           std::uint64_t options) override;
    std::vector<TagClaim> claims(const TaggedItem& item, std::uint64_t options) override;
    std::string_view name() const override { return "rules"; }

    /// All rules, with syntax errors, missing tags and files, unknown types: for the authors of rules.
    std::vector<RuleDescription> rules() const;

    /// The outcome of every rule without a problem, whether it gives tags or not. Messages logged meanwhile
    /// begin with the rule's number.
    std::vector<RuleOutcome> outcomesForXMLDocument(const std::shared_ptr<QVCTXMLDocument>& document) const;

  private:
    struct Rule {
        std::size_t number;
        std::string type;
        std::string text;
        std::optional<std::string> tag;
    };

    explicit QVCTXMLRulesTaggingService(const PropertyList::Dictionary& rules);
    void setupWithRules(const PropertyList::Dictionary& rules);
    static std::optional<std::string> problemOf(const Rule& rule);
    /// Calls `visit` with every tag, and the rule that gives it.
    template <typename Visit>
    void forEachTag(const std::shared_ptr<QVCTXMLDocument>& document, std::uint64_t options,
                    Visit visit) const;

    std::vector<Rule> rules_;
};

}  // namespace qvct
