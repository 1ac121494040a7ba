#include "autotagging/names/NameReader.h"

#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <array>
#include <cstdlib>

namespace qvct {
namespace {

constexpr std::string_view kService = "names";

/// Adds to a reading what one name says.
class Claims {
  public:
    Claims(NameReading& reading, std::string_view name, int distance)
        : reading_(reading), name_(name), distance_(distance) {}

    TagClaim& add(std::string_view label, std::uint32_t offset, std::uint32_t end, double confidence) {
        TagClaim& claim = reading_.claims.emplace_back();
        claim.label = label;
        claim.service = kService;
        claim.evidence = {std::string(name_.substr(offset, end - offset)), std::string(name_), offset};
        claim.confidence = confidence;
        claim.distance = distance_;
        return claim;
    }

    void add(const NamedKey& key, double confidence) {
        add(QVTagsOfKeys[static_cast<std::size_t>(key.tonic)], key.offset, key.end, confidence);
        if (key.mode == NamedKey::Mode::unsaid) return;
        const bool isMajor = key.mode == NamedKey::Mode::major;
        add(isMajor ? QVTagMajorKeyType : QVTagMinorKeyType, key.offset, key.end, confidence);
    }

  private:
    NameReading& reading_;
    std::string_view name_;
    int distance_;
};

}  // namespace

double NameReader::confidenceOf(NameStrength strength) const {
    switch (strength) {
        case NameStrength::word:
            return weights_.word;
        case NameStrength::abbreviation:
            return weights_.abbreviation;
        case NameStrength::likeness:
            return weights_.likeness;
        case NameStrength::figure:
            return weights_.figure;
        case NameStrength::hint:
            return weights_.hint;
    }
    return 0;
}

NameReading NameReader::read(std::span<const std::string_view> names, std::string_view extension) {
    NameReading reading;
    combinable_.clear();
    isOfPreset_ = habits_->isOfPreset(extension);
    if (names.empty()) return reading;
    const NameScan item(*habits_, names[0], itemPieces_.read(names[0]), NameScan::Owner::item, buffer_);
    addMeant(reading, item, 0);
    addNumbers(reading, item);
    std::optional<double> sharedTempo;
    std::optional<NamedKey> keyOfFolder;
    std::size_t folderOfKey = 0;
    for (std::size_t i = 1; i < names.size(); ++i) {
        const NameScan folder(*habits_, names[i], pieces_.read(names[i]), NameScan::Owner::folder, buffer_);
        addMeant(reading, folder, static_cast<int>(i));
        addNumbers(reading, folder);
        if (!sharedTempo) sharedTempo = item.tempoWith(folder);
        if (keyOfFolder || !folder.mayHaveKey()) continue;
        keyOfFolder = folder.key(folder.tempo());
        folderOfKey = i;
    }
    // What the name itself says holds whatever its folders say; they may say that it is a loop.
    auto tempo = sharedTempo;
    if (!tempo && (!reading.tempo || item.mayHaveKey())) tempo = item.tempo(reading.kind);
    if (!reading.tempo) reading.tempo = tempo;
    if (!reading.tempo) reading.possibleTempos = item.possibleTempos();
    if (const auto key = item.key(tempo))
        Claims(reading, names[0], 0).add(*key, weights_.key);
    else if (keyOfFolder)
        Claims(reading, names[folderOfKey], static_cast<int>(folderOfKey)).add(*keyOfFolder, weights_.key);
    const bool hasLength = reading.bars || reading.beats;
    if (reading.kind == SoundKind::unsaid && hasLength) reading.kind = SoundKind::loop;
    combine(reading);
    return reading;
}

void NameReader::addMeant(NameReading& reading, const NameScan& scan, int distance) {
    Claims claims(reading, scan.name(), distance);
    const auto owner = distance == 0 ? NameScan::Owner::item : NameScan::Owner::folder;
    for (const NameScan::Meant& meant : scan.meant()) {
        const bool isLetter = meant.end - meant.offset == 1;
        if (distance > 0 && isLetter) continue;
        const NamedMeaning& meaning = habits_->meaning(meant.word.meaning);
        TagClaim& claim = claims.add(distance > 0 ? meaning.inFolders : meaning.label, meant.offset,
                                     meant.end, confidenceOf(meant, scan, owner));
        claim.level = meaning.level;
        if (!meaning.combinations.empty()) combinable_.push_back({reading.claims.size() - 1, &meaning});
        claim.isHead = meant.end == scan.meant().back().end;
    }
    for (const auto& [offset, end] : scan.silences()) reading.silences.push_back({distance, offset, end});
}

void NameReader::addNumbers(NameReading& reading, const NameScan& scan) {
    if (!reading.tempo) reading.tempo = scan.tempo(reading.kind);
    if (reading.kind == SoundKind::unsaid) reading.kind = scan.kind();
    if (!reading.bars) reading.bars = scan.bars();
    if (!reading.beats) reading.beats = scan.beats();
}

double NameReader::confidenceOf(const NameScan::Meant& meant, const NameScan& scan,
                                NameScan::Owner owner) const {
    const NamedMeaning& meaning = habits_->meaning(meant.word.meaning);
    const bool isOfFolder = owner == NameScan::Owner::folder;
    const bool isInstrument = meaning.category == QVCategorySourceIdentifier && !meant.isOfPrefix;
    const bool isForeigner =
        isInstrument && ((isOfFolder && scan.isOfPack()) || isForeign(meaning, scan.prefix()));
    const bool isHint = isForeigner || (isOfFolder && isOfTitle(meaning, scan)) || areInitials(meant, scan);
    const double hint = confidenceOf(NameStrength::hint);
    if (isHint) return hint;
    const NameStrength strength = strengthOf(meant, scan);
    if (strength != NameStrength::hint) return confidenceOf(strength);
    // A preset plays notes, and an "Ice Rocket" nevertheless.
    constexpr double unlikely = 0.8;
    if (isOfPreset_ && !meaning.isPitched) return hint * unlikely;
    return isSecondHint(meant, scan) ? 1 - (1 - hint) * (1 - hint) : hint;
}

/// A dog is what was recorded, but a way to call a preset, and part of a title in
/// "what_my_dog_had_for_dinner".
NameStrength NameReader::strengthOf(const NameScan::Meant& meant, const NameScan& scan) const {
    const NameStrength strength = meant.word.strength;
    if (strength == NameStrength::figure)
        return isOfPreset_ || scan.unknownWords() > 1 ? NameStrength::hint : strength;
    const bool isFigurative = habits_->meaning(meant.word.meaning).isFigurative && !meant.isOfPrefix;
    return isFigurative && strength != NameStrength::hint ? NameStrength::figure : strength;
}

/// Two words of a name that hint at the same thing agree: "Detuned Pulse" is a synthesizer.
bool NameReader::isSecondHint(const NameScan::Meant& meant, const NameScan& scan) const {
    const auto wordOf = [&scan](const NameScan::Meant& its) {
        return scan.name().substr(its.offset, its.end - its.offset);
    };
    const std::string& label = habits_->meaning(meant.word.meaning).label;
    return std::any_of(scan.meant().begin(), scan.meant().end(), [&](const NameScan::Meant& other) {
        return strengthOf(other, scan) == NameStrength::hint && wordOf(other) != wordOf(meant) &&
               habits_->meaning(other.word.meaning).label == label;
    });
}

/// A folder whose name has words that mean nothing has a title: "The Mysterious Bank" is not mysterious.
bool NameReader::isOfTitle(const NamedMeaning& meaning, const NameScan& scan) {
    return scan.unknownWords() > 0 && meaning.category != QVCategorySourceIdentifier &&
           meaning.category != QVCategoryGenresIdentifier;
}

/// Two letters among words that mean nothing, or in front of a word for another instrument, are rather
/// somebody's than a tom's: "TM Wandering Star", "SD_Pop_Strings".
bool NameReader::areInitials(const NameScan::Meant& meant, const NameScan& scan) const {
    if (meant.word.strength != NameStrength::abbreviation || meant.end - meant.offset > 2) return false;
    const bool isAddress = meant.offset == 0 && scan.name().substr(meant.end).starts_with(' ');
    if (scan.unknownWords() > (isAddress ? 0 : 1)) return true;
    const std::string& root = habits_->meaning(meant.word.meaning).root;
    return meant.offset == 0 && std::any_of(scan.meant().begin(), scan.meant().end(), [&](const auto& other) {
               const NamedMeaning& its = habits_->meaning(other.word.meaning);
               return other.word.strength == NameStrength::word &&
                      its.category == QVCategorySourceIdentifier && its.root != root;
           });
}

/// "GLASCrsh_Window Crash" is glass: behind a prefix, words for what does not go with it only describe.
bool NameReader::isForeign(const NamedMeaning& meaning, std::span<const NamingHabits::Word> prefix) const {
    return !prefix.empty() && std::none_of(prefix.begin(), prefix.end(), [&](const NamingHabits::Word& word) {
        const std::string& root = habits_->meaning(word.meaning).root;
        return root == meaning.root || weights_.goTogether(root, meaning.root);
    });
}

/// Of a bass in a folder of synthesizers: that it is a synth bass, as surely as the less sure of both says
/// so.
void NameReader::combine(NameReading& reading) const {
    const std::size_t count = reading.claims.size();
    for (const auto& [number, meaning] : combinable_) {
        for (std::size_t i = 0; i < count; ++i) {
            if (std::abs(reading.claims[i].distance - reading.claims[number].distance) > 1) continue;
            const double confidence =
                std::min(reading.claims[number].confidence, reading.claims[i].confidence);
            for (const auto& [with, label] : meaning->combinations)
                if (reading.claims[i].label == with) combine(reading, number, label, confidence);
        }
    }
}

void NameReader::combine(NameReading& reading, std::size_t number, const std::string& label,
                         double confidence) {
    const auto known = std::find_if(reading.claims.begin(), reading.claims.end(), [&](const TagClaim& claim) {
        return claim.label == label && claim.distance == reading.claims[number].distance;
    });
    if (known != reading.claims.end()) {
        known->confidence = std::max(known->confidence, confidence);
        return;
    }
    TagClaim claim = reading.claims[number];
    claim.label = label;
    claim.confidence = confidence;
    reading.claims.push_back(std::move(claim));
}

}  // namespace qvct
