#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"
#include "platform/data/PropertyList.h"
#include "resources/ReplacementFile.h"

#include <map>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// How much each piece of evidence for a tag weighs; see docs/evidence.md. All are in [0, 1].
struct QVCT_API EvidenceWeights {
    double word = 0;          ///< What a plain word of a name says.
    double abbreviation = 0;  ///< What an abbreviation says.
    double likeness = 0;      ///< What is near to a word, or ends with one.
    double hint = 0;          ///< What a word says that often means something else.
    double figure = 0;        ///< What a word says that often only describes something else.
    double key = 0;           ///< A key that a name spells.
    std::map<std::string, double, std::less<>> services;  ///< By what each service is called.
    std::vector<double> distances;                        ///< By distance; see TagClaim.
    std::vector<std::vector<std::string>> together;       ///< Instruments that go together.
    double headWord = 0;                                  ///< Added for the last word of a name.
    double support = 0;                                   ///< What a parent that is claimed gives its child.
    double contradiction = 0;                             ///< What the second best takes from the best.
    double threshold = 0;                                 ///< Below it nothing is said.

    /// Those of the file that replaces the built-in ones, else the built-in ones.
    static EvidenceWeights defaultWeights();
    /// The file that may replace them. It is broken, with an error that names the line and the entry, when
    /// `weightsWithDictionary` has a fault to find.
    static ResourceFile file();
    /// Nothing, and an error that names the entry, when one is missing, is no number in [0, 1] or no list of
    /// labels.
    static std::optional<EvidenceWeights> weightsWithDictionary(const PropertyList::Dictionary& dictionary,
                                                                Error* error = nullptr);

    /// 1 for a service that is not listed.
    double ofService(std::string_view name) const;
    /// The last one for all that are farther.
    double ofDistance(int distance) const;
    /// Whether two instruments without parents are of one group of `together`.
    bool goTogether(const std::string& a, const std::string& b) const;
};

}  // namespace qvct
