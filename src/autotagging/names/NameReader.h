#pragma once

#include "autotagging/evidence/EvidenceWeights.h"
#include "autotagging/evidence/SoundKind.h"
#include "autotagging/evidence/TagClaim.h"
#include "autotagging/names/NamePieces.h"
#include "autotagging/names/NameScan.h"
#include "autotagging/names/NamingHabits.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <span>
#include <string>
#include <string_view>
#include <vector>

namespace qvct {

/// What a bar holds where nothing says otherwise.
inline constexpr int kUsualBeatsOfBar = 4;

/// What the name of an item and those of its folders say.
struct NameReading {
    /// A phrase whose words do not mean what they say elsewhere.
    struct Silence {
        int distance;
        std::uint32_t offset;
        std::uint32_t end;
    };

    std::vector<TagClaim> claims;
    std::vector<Silence> silences;
    std::optional<double> tempo;  ///< Beats a minute.
    /// Numbers of the item's own name that may be its tempo if its length agrees; none where `tempo` is
    /// known.
    std::vector<double> possibleTempos;
    std::optional<int> bars;   ///< How long it is said to be.
    std::optional<int> beats;  ///< The same in beats.
    SoundKind kind = SoundKind::unsaid;
};

/// Reads names as people write them.
///
/// Use one from one thread at a time: its buffers are used again.
/// @cost  Some microseconds for a path; O(bytes).
class NameReader {
  public:
    explicit NameReader(std::shared_ptr<const NamingHabits> habits = NamingHabits::defaultHabits(),
                        EvidenceWeights weights = EvidenceWeights::defaultWeights())
        : habits_(std::move(habits)), weights_(std::move(weights)) {}

    /// The item's own name comes first, without its extension, then its folder's, and so on up to the
    /// outermost that counts.
    /// `extension`: its own, which tells a preset from a sound.
    NameReading read(std::span<const std::string_view> names, std::string_view extension = {});

  private:
    /// A claim that may be one for something finer.
    struct Combinable {
        std::size_t claim;
        const NamedMeaning* meaning;
    };

    void addMeant(NameReading& reading, const NameScan& scan, int distance);
    static void addNumbers(NameReading& reading, const NameScan& scan);
    double confidenceOf(NameStrength strength) const;
    NameStrength strengthOf(const NameScan::Meant& meant, const NameScan& scan) const;
    double confidenceOf(const NameScan::Meant& meant, const NameScan& scan, NameScan::Owner owner) const;
    bool isSecondHint(const NameScan::Meant& meant, const NameScan& scan) const;
    static bool isOfTitle(const NamedMeaning& meaning, const NameScan& scan);
    bool areInitials(const NameScan::Meant& meant, const NameScan& scan) const;
    bool isForeign(const NamedMeaning& meaning, std::span<const NamingHabits::Word> prefix) const;
    void combine(NameReading& reading) const;
    static void combine(NameReading& reading, std::size_t number, const std::string& label,
                        double confidence);

    std::shared_ptr<const NamingHabits> habits_;
    EvidenceWeights weights_;
    NamePieces itemPieces_, pieces_;
    std::vector<Combinable> combinable_;
    std::string buffer_;
    bool isOfPreset_ = false;
};

}  // namespace qvct
