#include "autotagging/names/Thesaurus.h"

#include "autotagging/names/NamingHabits.h"

namespace qvct {

Thesaurus::Thesaurus() : habits_(NamingHabits::defaultHabits()) {}

Thesaurus::~Thesaurus() = default;

std::optional<MeantTag> Thesaurus::tagMeant(std::string_view text) const {
    const NamedMeaning* meaning = habits_->meaningOf(text);
    if (meaning == nullptr) return std::nullopt;
    return MeantTag{meaning->label, meaning->level};
}

}  // namespace qvct
