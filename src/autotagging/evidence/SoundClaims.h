#pragma once

#include "autotagging/evidence/TagClaim.h"

#include <vector>

namespace qvct {

struct HeardSound;

/// The tags that what can be heard speaks for, with what was measured as evidence: the instrument of a single
/// sound, the key of a loop, and on which of two poles a sound lies, unless it lies in between.
std::vector<TagClaim> claimsOfSound(const HeardSound& sound);

}  // namespace qvct
