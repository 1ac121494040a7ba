#pragma once

#include "platform/base/Error.h"

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {
struct Resolution;
class TGRTTaxonomy;
}  // namespace qvct

namespace qvct::tool {

/// What a person says that an item is.
struct LabelledItem {
    std::string path;
    std::vector<std::string> labels;  ///< Each is right by itself; none where nothing can be told.
    std::uint64_t line = 0;
};

/// A table of "path" and "label", tab-separated, with these two words in its first line; "A|B" where either
/// is right, "-" where nothing can be told. Nothing, and an error with the line, for any other file.
std::optional<std::vector<LabelledItem>> readLabelledItems(const std::string& path, Error* error);

/// Compares what is said of items with what people say. Of each item it asks for one tag, in the category of
/// its label: the surest that is not the parent of another that is said.
class Evaluation {
  public:
    struct Score {
        std::size_t truth = 0;    ///< Items that have the label.
        std::size_t said = 0;     ///< Items of which it is said.
        std::size_t right = 0;    ///< Both.
        std::size_t general = 0;  ///< Only a parent of the label is said: true, but not all.

        double precision() const;
        double recall() const;
        double f() const;
    };
    struct Mistake {
        std::string path;
        std::string label;  ///< Empty where nothing could be told.
        std::string said;   ///< Empty where nothing was said.
    };

    explicit Evaluation(const TGRTTaxonomy& taxonomy) : taxonomy_(taxonomy) {}

    void add(const LabelledItem& item, const Resolution& resolution);

    const Score& overall() const { return overall_; }
    const std::map<std::string, Score>& labels() const { return labels_; }
    const std::vector<Mistake>& mistakes() const { return mistakes_; }
    std::size_t items() const { return items_; }

  private:
    std::string saidOf(const Resolution& resolution, std::string_view category) const;

    const TGRTTaxonomy& taxonomy_;
    std::size_t items_ = 0;
    Score overall_;
    std::map<std::string, Score> labels_;
    std::vector<Mistake> mistakes_;
};

}  // namespace qvct::tool
