#pragma once

#include "platform/base/ObjectSet.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <vector>

namespace qvct::tool {

class ToolContext;

/// "Category/Label" or "Category/Label=LEVEL" as typed. The first "/" separates category and label, so that
/// labels may contain one ("Bright / Dark"). The last "=" separates the level, if one follows it: 0 to 1, or
/// 0% to 100%.
struct TagArgument {
    std::string category;
    std::string label;
    std::optional<double> level;
    bool hasWrongLevel = false;  ///< What follows the last "=" is meant as a level, and is none.

    /// Nothing when there is no category or no label.
    static std::optional<TagArgument> parse(std::string_view text, bool takesLevel);
};

/// What is to be changed, as typed. Tags to reject and to accept may come without their category.
struct TaggingArguments {
    std::vector<std::string> add;
    std::vector<std::string> remove;
    std::vector<std::string> reject;
    std::vector<std::string> accept;
    bool creates = false;  ///< The default taxonomy need not know the tags.
};

/// A change of an item's taggings, and of the tags that are rejected for it.
///
/// What is said last counts: an item has no tag that it rejects, nor one below that.
class TaggingEdit {
  public:
    /// Wrong arguments are reported as wrong usage.
    static std::optional<TaggingEdit> make(const TaggingArguments& arguments, ToolContext& context);

    bool isEmpty() const {
        return added_.empty() && removed_.empty() && rejected_.empty() && accepted_.empty();
    }
    /// The taggings without those to remove or reject, and with those to add; these replace the same tag at
    /// another level, or that a service set.
    ObjectSet<TGRTTagging> apply(const ObjectSet<TGRTTagging>& taggings) const;
    /// The rejected labels without those to accept or add and those above these, and with those to reject.
    std::set<std::string> apply(std::set<std::string> rejectedLabels) const;

  private:
    /// Each answers what is wrong; nothing when nothing is.
    std::string add(const std::string& text, bool creates);
    std::string remove(const std::string& text);
    std::string reject(const std::string& text, bool creates);
    std::string accept(const std::string& text, bool creates);

    std::vector<std::shared_ptr<TGRTTagging>> added_;
    std::vector<TagArgument> removed_;
    std::set<std::string> rejected_;
    std::set<std::string> accepted_;
};

/// The taggings of `a` that are not in `b`, or are there by a service where a person set them, or vice versa.
ObjectSet<TGRTTagging> difference(const ObjectSet<TGRTTagging>& a, const ObjectSet<TGRTTagging>& b);

}  // namespace qvct::tool
