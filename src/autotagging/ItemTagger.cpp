#include "autotagging/ItemTagger.h"

#include "autotagging/ContentItem.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/names/NameReader.h"
#include "autotagging/names/TempoChoice.h"
#include "autotagging/services/QVCTAutoTaggingService.h"
#include "listening/HeardSound.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "platform/base/bytes/Printable.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

constexpr std::string_view kKeywords = "keywords";
constexpr std::string_view kContentType = "content-type";
constexpr std::string_view kSound = "sound";
constexpr std::string_view kOneShot = "One Shot";

/// Judges what keywords claim by what the names mean: a keyword sees a word, and no more.
class KeywordJudge {
  public:
    KeywordJudge(const NameReading& reading, const TGRTTaxonomy& taxonomy)
        : reading_(reading), taxonomy_(taxonomy) {}

    void judge(TagClaim& claim) const {
        const auto tag = taxonomy_.findTagForLabel(claim.label);
        if (!tag) return;
        if (const std::string phrase = silenceAround(claim); !phrase.empty()) {
            claim.doubt = fmt::format("part of \"{}\"", phrase);
        } else if (tag->categoryIdentifier() == QVCategoryContentTypeIdentifier) {
            claim.doubt = "the file says what kind of content it is";
        } else if (isKey(*tag)) {
            claim.doubt = "no key stands there";
        } else {
            judgeWord(claim, *tag);
        }
    }

  private:
    static bool isKey(const TGRTTag& tag) {
        const auto parent = tag.parent();
        const std::string& group = parent ? parent->label() : tag.label();
        return group == QVTagKey || group == QVTagKeyType;
    }

    static bool overlap(const TagClaim& claim, int distance, std::uint32_t offset, std::uint32_t end) {
        return claim.distance == distance && claim.evidence.offset < end && offset < claim.end();
    }

    std::string silenceAround(const TagClaim& claim) const {
        for (const auto& [distance, offset, end] : reading_.silences) {
            if (overlap(claim, distance, offset, end))
                return claim.evidence.where.substr(offset, end - offset);
        }
        return {};
    }

    /// The same word that the names read says what they read in it: not more surely, and nothing else but
    /// what that belongs to.
    void judgeWord(TagClaim& claim, const TGRTTag& tag) const {
        const TagClaim* other = nullptr;
        for (const TagClaim& named : reading_.claims) {
            if (!overlap(claim, named.distance, named.evidence.offset, named.end())) continue;
            if (named.label == claim.label || isParent(tag, named.label)) {
                claim.confidence = std::min(claim.confidence, named.confidence);
                return;
            }
            const auto its = taxonomy_.findTagForLabel(named.label);
            if (its && isKey(*its)) other = &named;
            // A keyword of the same word says something else of it, as a user's own may.
            if (!its || claim.evidence.what.size() >= named.evidence.what.size()) continue;
            const std::string& category = its->categoryIdentifier();
            const bool isOfGenre = tag.categoryIdentifier() == QVCategoryGenresIdentifier ||
                                   category == QVCategoryGenresIdentifier;
            if (isOfGenre || category == tag.categoryIdentifier()) other = &named;
        }
        if (other != nullptr) claim.doubt = fmt::format("\"{}\" is {}", other->evidence.what, other->label);
    }

    bool isParent(const TGRTTag& above, const std::string& label) const {
        const auto tag = taxonomy_.findTagForLabel(label);
        for (auto parent = tag ? tag->parent() : nullptr; parent; parent = parent->parent())
            if (parent.get() == &above) return true;
        return false;
    }

    const NameReading& reading_;
    const TGRTTaxonomy& taxonomy_;
};

std::optional<int> beatsOf(const NameReading& reading) {
    if (reading.beats || !reading.bars) return reading.beats;
    return *reading.bars * kUsualBeatsOfBar;
}

/// A number of a name that agrees with the length of the sound is its tempo, and the sound a loop.
void addTempoByLength(NameReading& reading, ContentItem& item, ItemReport& report) {
    if (reading.possibleTempos.empty()) return;
    const auto file = item.fileData();
    const auto fitting = file ? tempoThatFits(reading, file->lengthInSeconds()) : std::nullopt;
    if (!fitting) return;
    report.tempo = fitting->tempo;
    report.beats = fitting->beats;
    report.isTempoFromLength = true;
    if (reading.kind == SoundKind::unsaid) reading.kind = SoundKind::loop;
}

/// What is short is a single sound, unless it is to be repeated by its name, or if that is silent by its
/// sound.
void judgeOneShot(std::vector<TagClaim>& claims, SoundKind named, SoundKind heard) {
    if ((named == SoundKind::unsaid ? heard : named) != SoundKind::loop) return;
    for (TagClaim& claim : claims)
        if (claim.label == kOneShot && claim.service == kContentType)
            claim.doubt =
                named == SoundKind::loop ? "its name says that it is a loop" : "it sounds like a loop";
}

/// In a loop several things may play; what it sounds like as a whole is no instrument.
void judgeHeardInstrument(std::vector<TagClaim>& claims, SoundKind kind, const TGRTTaxonomy& taxonomy) {
    if (kind != SoundKind::loop) return;
    for (TagClaim& claim : claims) {
        const auto tag = claim.service == kSound ? taxonomy.findTagForLabel(claim.label) : nullptr;
        if (tag && tag->categoryIdentifier() == QVCategorySourceIdentifier)
            claim.doubt = "its name says that it is a loop";
    }
}

/// By the sound alone only what it says clearly.
SoundKind kindOf(const HeardSound* sound) {
    constexpr double kClear = 0.9;
    if (sound == nullptr || !sound->loopConfidence) return SoundKind::unsaid;
    if (*sound->loopConfidence >= kClear) return SoundKind::loop;
    return *sound->loopConfidence <= 1 - kClear ? SoundKind::oneShot : SoundKind::unsaid;
}

std::string_view nameOf(std::string_view folder) {
    return folder.substr(folder.rfind('/') + 1);
}

SoundKind kindOf(const NameReading& reading, SoundKind heard, const std::vector<TagClaim>& claims) {
    if (reading.kind != SoundKind::unsaid) return reading.kind;
    if (heard != SoundKind::unsaid) return heard;
    const bool isOneShot = std::any_of(claims.begin(), claims.end(), [](const TagClaim& claim) {
        return claim.label == kOneShot && claim.service == kContentType && claim.doubt.empty();
    });
    return isOneShot ? SoundKind::oneShot : SoundKind::unsaid;
}

}  // namespace

ObjectSet<TGRTTagging> ItemReport::taggings() const {
    ObjectSet<TGRTTagging> taggings;
    for (const HeldTag& held : resolution.held) taggings.insert(held.tagging());
    return taggings;
}

ObjectSet<TGRTTagging> ItemReport::withoutRejected(const ObjectSet<TGRTTagging>& stored) {
    ObjectSet<TGRTTagging> kept;
    for (const auto& tagging : stored) {
        std::string reason = rejections.reasonFor(*tagging->tag());
        if (reason.empty()) {
            kept.insert(tagging);
        } else {
            resolution.dropped.push_back({tagging->label(), 1, std::move(reason), {}});
        }
    }
    return kept;
}

ItemTagger::ItemTagger(std::shared_ptr<QVTaggingAggregator> aggregator,
                       std::shared_ptr<const TGRTTaxonomy> taxonomy)
    : aggregator_(std::move(aggregator)), taxonomy_(std::move(taxonomy)), resolver_(taxonomy_) {}

ItemTagger::~ItemTagger() = default;

NameReader& ItemTagger::reader() {
    if (!reader_) reader_ = std::make_unique<NameReader>(NamingHabits::defaultHabits(), resolver_.weights());
    return *reader_;
}

Rejections ItemTagger::rejectionsOf(ContentItem& item, const ItemNames& names) {
    Rejections rejections;
    const auto record = item.record();
    if (record && !record->rejectedLabels().empty())
        rejections.add(std::make_shared<const Rejections::Labels>(record->rejectedLabels()), "in its record");
    for (const std::string_view folder : names.folders()) {
        if (auto labels = folders_.ofFolder(folder))
            rejections.add(std::move(labels), fmt::format("in the folder \"{}\"", printable(nameOf(folder))));
    }
    if (!record || rejections.empty()) return rejections;
    for (const auto& tagging : record->taggings())
        if (!tagging->isAutoTagging()) rejections.except(*tagging->tag());
    return rejections;
}

void ItemTagger::reject(std::vector<TagClaim>& claims, const Rejections& rejections) const {
    if (rejections.empty()) return;
    for (TagClaim& claim : claims) {
        const auto tag = taxonomy_->findTagForLabel(claim.label);
        std::string reason = tag ? rejections.reasonFor(*tag) : std::string();
        if (!reason.empty()) claim.doubt = std::move(reason);
    }
}

ItemReport ItemTagger::report(const std::shared_ptr<ContentItem>& item, const ItemNames& names,
                              std::uint64_t options) {
    ItemReport report;
    std::vector<TagClaim> claims =
        aggregator_->claimsOfItem(item, names.all(), options & ~QVCTAutoTaggingOptionNames);
    report.sound = item->file().heardSound();
    const SoundKind heard = kindOf(report.sound.get());
    NameReading reading;
    if ((options & QVCTAutoTaggingOptionNames) != 0) {
        reading = reader().read(names.all(), names.extension());
        const KeywordJudge judge(reading, *taxonomy_);
        for (TagClaim& claim : claims)
            if (claim.service == kKeywords) judge.judge(claim);
        report.tempo = reading.tempo;
        report.beats = beatsOf(reading);
        addTempoByLength(reading, *item, report);
        claims.insert(claims.end(), reading.claims.begin(), reading.claims.end());
    }
    judgeOneShot(claims, reading.kind, heard);
    report.kind = kindOf(reading, heard, claims);
    judgeHeardInstrument(claims, report.kind, *taxonomy_);
    report.rejections = rejectionsOf(*item, names);
    reject(claims, report.rejections);
    report.resolution = resolver_.resolve(std::move(claims), report.kind);
    return report;
}

ItemReport ItemTagger::reportOfNames(const ItemNames& names, SoundKind otherwise) {
    NameReading reading = reader().read(names.all(), names.extension());
    ItemReport report;
    report.tempo = reading.tempo;
    report.beats = beatsOf(reading);
    report.kind = reading.kind == SoundKind::unsaid ? otherwise : reading.kind;
    report.resolution = resolver_.resolve(std::move(reading.claims), report.kind);
    return report;
}

}  // namespace qvct
