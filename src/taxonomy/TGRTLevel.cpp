#include "taxonomy/TGRTLevel.h"

#include <algorithm>

#include <fmt/format.h>

namespace qvct {

namespace {

std::size_t hashOf(double weight) {
    fmt::memory_buffer text;
    fmt::format_to(std::back_inserter(text), "TGRTLevel {:f}", weight);
    return stringHash({text.data(), text.size()});
}

}  // namespace

TGRTLevel::TGRTLevel(double weight)
    : hash_(hashOf(weight)),
      // In this order a weight that is not a number becomes 0.
      weight_(std::max(0.0, std::min(weight, 1.0))) {}

std::shared_ptr<TGRTLevel> TGRTLevel::levelWithWeight(double weight) {
    return std::shared_ptr<TGRTLevel>(new TGRTLevel(weight));
}

bool TGRTLevel::isEqual(const Object& other) const {
    return dynamic_cast<const TGRTLevel*>(&other) != nullptr && other.hash() == hash();
}

std::string TGRTLevel::description() const {
    return fmt::format("<TGRTLevel {}> weight:{:f}", static_cast<const void*>(this), weight_);
}

}  // namespace qvct
