#pragma once

#include "autotagging/names/NamingHabits.h"

#include <memory>
#include <span>

namespace qvct {

/// As `NamingHabits::initWithDictionaries` says.
std::shared_ptr<const NamingHabits> readNamingHabits(std::span<const PropertyList::Dictionary> dictionaries,
                                                     const TGRTTaxonomy& taxonomy, Error* error,
                                                     PropertyListPath* place);

}  // namespace qvct
