#include "autotagging/names/Thesaurus.h"

#include "autotagging/names/NamingHabits.h"

namespace qvct {

Thesaurus::Thesaurus() : habits_(NamingHabits::defaultHabits()) {}

Thesaurus::~Thesaurus() = default;

std::vector<std::string> Thesaurus::labelsMeant(std::string_view text) const {
    return habits_->labelsMeant(text);
}

}  // namespace qvct
