#include "operations/Evaluation.h"

#include "autotagging/evidence/ClaimResolver.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Text.h"
#include "taxonomy/TGRTTaxonomy.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct::tool {
namespace {

double ratio(std::size_t part, std::size_t whole) {
    return whole == 0 ? 1 : static_cast<double>(part) / static_cast<double>(whole);
}

bool isAncestor(const TGRTTag& above, const TGRTTag& tag) {
    const auto ancestors = tag.ancestors();
    return std::any_of(ancestors.begin(), ancestors.end(),
                       [&above](const auto& its) { return its.get() == &above; });
}

}  // namespace

std::optional<std::vector<LabelledItem>> readLabelledItems(const std::string& path, Error* error) {
    const auto text = readTextFile(path, error);
    if (!text) return std::nullopt;
    std::vector<LabelledItem> items;
    std::uint64_t line = 0;
    for (const std::string& row : split(replaceAll(*text, "\r\n", "\n"), "\n")) {
        const std::vector<std::string> fields = split(row, "\t");
        const bool isSound = fields.size() == 2 && !fields[0].empty() && !fields[1].empty();
        const bool isHeader = ++line == 1;
        if (row.empty() && !isHeader) continue;
        if (!isSound || (isHeader && (fields[0] != "path" || fields[1] != "label"))) {
            fail(error, kErrorMalformed,
                 isHeader ? "is not \"path\", tab, \"label\"" : "is not a path, a tab and a label",
                 {.path = path, .line = line});
            return std::nullopt;
        }
        if (isHeader) continue;
        items.push_back(
            {fields[0], fields[1] == "-" ? std::vector<std::string>() : split(fields[1], "|"), line});
    }
    return items;
}

double Evaluation::Score::precision() const {
    return ratio(right + general, said);
}

double Evaluation::Score::recall() const {
    return ratio(right, truth);
}

double Evaluation::Score::f() const {
    const double sum = precision() + recall();
    return sum == 0 ? 0 : 2 * precision() * recall() / sum;
}

std::string Evaluation::saidOf(const Resolution& resolution, std::string_view category) const {
    for (const HeldTag& held : resolution.held) {
        if (held.tag->categoryIdentifier() != category) continue;
        const bool isParent =
            std::any_of(resolution.held.begin(), resolution.held.end(),
                        [&held](const HeldTag& other) { return isAncestor(*held.tag, *other.tag); });
        if (!isParent) return held.tag->label();
    }
    return {};
}

void Evaluation::add(const LabelledItem& item, const Resolution& resolution) {
    ++items_;
    const auto first = item.labels.empty() ? nullptr : taxonomy_.findTagForLabel(item.labels.front());
    const std::string said =
        saidOf(resolution, first ? first->categoryIdentifier() : std::string(QVCategorySourceIdentifier));
    const auto tag = said.empty() ? nullptr : taxonomy_.findTagForLabel(said);
    const bool isRight = std::find(item.labels.begin(), item.labels.end(), said) != item.labels.end();
    const bool isGeneral =
        !isRight && tag && std::any_of(item.labels.begin(), item.labels.end(), [&](const auto& label) {
            const auto its = taxonomy_.findTagForLabel(label);
            return its && isAncestor(*tag, *its);
        });
    // Of several that are right, the one that was said.
    const std::string label = isRight ? said : item.labels.empty() ? "" : item.labels.front();
    const auto count = [&](Score& score, bool hasTruth, bool hasSaid) {
        score.truth += hasTruth ? 1 : 0;
        score.said += hasSaid ? 1 : 0;
        score.right += isRight && hasSaid ? 1 : 0;
        score.general += isGeneral && hasSaid ? 1 : 0;
    };
    count(overall_, !label.empty(), !said.empty());
    if (!label.empty()) count(labels_[label], true, said == label);
    if (!said.empty() && said != label) count(labels_[said], false, true);
    if (!isRight && said != label) mistakes_.push_back({item.path, label, said});
}

}  // namespace qvct::tool
