#pragma once

#include "platform/base/ObjectSet.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <memory>
#include <optional>
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

/// A change of an item's taggings.
class TaggingEdit {
  public:
    /// Wrong arguments are reported as wrong usage. Tags to add must be in the default taxonomy, unless
    /// `creates`.
    static std::optional<TaggingEdit> make(const std::vector<std::string>& add,
                                           const std::vector<std::string>& remove, bool creates,
                                           ToolContext& context);

    bool isEmpty() const { return added_.empty() && removed_.empty(); }
    /// The taggings without those to remove, and with those to add; these replace the same tag at another
    /// level.
    ObjectSet<TGRTTagging> apply(const ObjectSet<TGRTTagging>& taggings) const;

  private:
    /// Each answers what is wrong; nothing when nothing is.
    std::string add(const std::string& text, bool creates);
    std::string remove(const std::string& text);

    std::vector<std::shared_ptr<TGRTTagging>> added_;
    std::vector<TagArgument> removed_;
};

/// The taggings of `a` that are not in `b`.
ObjectSet<TGRTTagging> difference(const ObjectSet<TGRTTagging>& a, const ObjectSet<TGRTTagging>& b);

}  // namespace qvct::tool
