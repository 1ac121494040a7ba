#include "listening/rhythm/NoteLookup.h"

#include <algorithm>
#include <cmath>

namespace qvct {

NoteLookup::NoteLookup(const std::vector<Note>& notes) : notes_(notes) {
    starts_.reserve(notes.size());
    for (std::size_t i = 0; i < notes.size(); ++i) {
        if (!std::isnan(notes[i].startTime)) starts_.emplace_back(notes[i].startTime, i);
    }
    std::sort(starts_.begin(), starts_.end());
}

const Note* NoteLookup::firstIn(double from, double to) const {
    auto at = std::lower_bound(starts_.begin(), starts_.end(), from,
                               [](const auto& start, double time) { return start.first < time; });
    std::size_t first = notes_.size();
    for (; at != starts_.end() && at->first < to; ++at) first = std::min(first, at->second);
    return first < notes_.size() ? &notes_[first] : nullptr;
}

int NoteLookup::velocityIn(double from, double to) const {
    const Note* note = firstIn(from, to);
    return note ? note->velocity : 0;
}

}  // namespace qvct
