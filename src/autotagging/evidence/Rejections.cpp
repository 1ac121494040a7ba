#include "autotagging/evidence/Rejections.h"

#include "taxonomy/TGRTTag.h"

#include <utility>

#include <fmt/format.h>

namespace qvct {

void Rejections::add(std::shared_ptr<const Labels> labels, std::string where) {
    if (labels && !labels->empty()) sources_.push_back({std::move(labels), std::move(where)});
}

void Rejections::except(const TGRTTag& tag) {
    excepted_.insert(tag.label());
    for (const auto& above : tag.ancestors()) excepted_.insert(above->label());
}

std::string Rejections::reasonFor(const TGRTTag& tag) const {
    if (empty()) return {};
    const auto ancestors = tag.ancestors();
    for (const auto& [labels, where] : sources_) {
        const auto isRejected = [this, &rejected = *labels](const std::string& label) {
            return rejected.contains(label) && !excepted_.contains(label);
        };
        if (isRejected(tag.label())) return "rejected " + where;
        for (const auto& above : ancestors)
            if (isRejected(above->label())) return fmt::format("{} is rejected {}", above->label(), where);
    }
    return {};
}

}  // namespace qvct
