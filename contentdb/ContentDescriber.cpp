#include "contentdb/ContentDescriber.h"

#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "autotagging/QVTaggingAggregator.h"
#include "autotagging/ResourceFiles.h"
#include "contentdb/index/PayloadHash.h"
#include "contentdb/store/Digest.h"
#include "contentdb/store/codec/ExplanationCodec.h"
#include "contentdb/store/codec/SoundCodec.h"
#include "formats/QVContentTaggingTypes.h"
#include "indexing/TGRTIndexableContentObject.h"
#include "listening/HeardSound.h"
#include "media/loopfile/LCFileData.h"
#include "platform/base/Version.h"
#include "platform/base/bytes/BytesAsText.h"
#include "platform/files/FileAccess.h"
#include "platform/text/Decimal.h"
#include "platform/text/RegularExpression.h"
#include "platform/text/Text.h"

#include <array>
#include <cmath>
#include <unordered_set>
#include <utility>

namespace qvct::contentdb {
namespace {

using Taggings = ObjectSet<TGRTTagging>;

IndexedTagging indexed(const TGRTTagging& tagging, Provenance provenance, std::string_view service) {
    IndexedTagging result;
    result.label = tagging.label();
    result.category = tagging.category();
    for (auto above = tagging.tag()->parent(); above; above = above->parent())
        result.ancestors.push_back(above->label());
    if (tagging.level()) result.level = tagging.level()->weight();
    result.provenance = provenance;
    result.service = service;
    result.isAuto = tagging.isAutoTagging();
    return result;
}

/// Adds those that are not there yet.
void addTaggings(IndexedItem& item, Taggings& known, const Taggings& added, Provenance provenance,
                 std::string_view service = {}) {
    for (const auto& tagging : added) {
        if (known.insert(tagging)) item.taggings.push_back(indexed(*tagging, provenance, service));
    }
}

/// Which of the item's taggings it is; their number when it is none.
std::size_t placeOf(const TGRTTagging& tagging, const IndexedItem& item) {
    const IndexedTagging wanted = indexed(tagging, Provenance::automatic, {});
    const auto found =
        std::find_if(item.taggings.begin(), item.taggings.end(), [&wanted](const IndexedTagging& its) {
            return its.label == wanted.label && its.category == wanted.category && its.level == wanted.level;
        });
    return static_cast<std::size_t>(found - item.taggings.begin());
}

/// Whether the number only says that nothing is known.
bool isUnknown(std::string_view key, double value) {
    constexpr std::array zeroIfUnknown = {QVContentKeyLengthInSeconds, QVContentKeyBeatCount,
                                          QVContentKeySignatureTop, QVContentKeySignatureBottom};
    if (key == QVContentKeyMidiRootNote) return value < 0;
    return value == 0 && std::find(zeroIfUnknown.begin(), zeroIfUnknown.end(), key) != zeroIfUnknown.end();
}

bool hasValue(const IndexedItem& item, std::string_view key) {
    return std::any_of(item.values.begin(), item.values.end(),
                       [key](const IndexedValue& value) { return value.key == key; });
}

bool isKnown(std::string_view key, double number) {
    return std::isfinite(number) && !isUnknown(key, number);
}

void addNumber(IndexedItem& item, std::string_view key, double number) {
    if (isKnown(key, number) && !hasValue(item, key))
        item.values.push_back({std::string(key), decimalOf(number)});
}

/// To an item that has no values yet. Records come with any number of them.
void addValues(IndexedItem& item, const ObjectSet<TGRTKeyValue>& values) {
    std::unordered_set<std::string> keys;
    for (const auto& keyValue : values) {
        if (const auto& text = keyValue->stringValue()) {
            keys.insert(keyValue->key());
            item.values.push_back({keyValue->key(), *text});
        } else if (const auto& value = keyValue->numberValue()) {
            const auto number = value->doubleValue();
            if (number && isKnown(keyValue->key(), *number) && keys.insert(keyValue->key()).second)
                item.values.push_back({keyValue->key(), decimalOf(*number)});
        }
    }
}

/// What the place of a sound between two poles is called as a number.
struct TraitField {
    std::string_view scale, key;
    bool isOfFirstPole = false;  ///< More of it is nearer to the first pole.
};

constexpr std::array kTraitFields = std::to_array<TraitField>({{"Bright / Dark", "Brightness", true},
                                                               {"Cold / Warm", "Warmth"},
                                                               {"Soft / Hard", "Hardness"},
                                                               {"Smooth / Rough", "Roughness"},
                                                               {"Tonal / Non-Tonal", "Noisiness"},
                                                               {"Low / High", "Height"},
                                                               {"Narrow / Wide", "Width"},
                                                               {"Simple / Complex", "Complexity"}});

double roundedTo(double value, double steps) {
    return std::round(value * steps) / steps;
}

}  // namespace

struct ContentDescriber::Implementation {
    Implementation(std::uint64_t options, const std::vector<std::string>& indexed) : services(options) {
        for (const std::string& folder : indexed) folders.push_back(URL::fileURLWithPath(folder).path());
    }

    static constexpr std::uint64_t kOptions = kIndexInMutableTaxonomy | kIndexWithoutRecord;
    // The record may name tags of the user's own, while services name the taxonomy's. The user's are added to
    // a taxonomy of this describer's own, since other threads may be describing, too.
    std::shared_ptr<TGRTTaxonomy> taxonomyOfRecords =
        TGRTTaxonomy::newTaxonomyOfType(kDefaultTaxonomy, false, false);
    std::shared_ptr<TGRTTaxonomy> taxonomyOfServices = TGRTTaxonomy::defaultTaxonomy();
    std::uint64_t services;
    std::vector<std::string> folders;
    bool needsXmlDocument() const {
        constexpr std::uint64_t readers = QVCTAutoTaggingOptionXMLRules |
                                          QVCTAutoTaggingOptionSoftwareInstruments |
                                          QVCTAutoTaggingOptionContentType;
        return (services & readers) != 0;
    }
    std::shared_ptr<QVTaggingAggregator> aggregator = QVTaggingAggregator::defaultTaggingAggregator();
    ItemTagger tagger{aggregator, taxonomyOfServices};
    RegularExpression tempoInName = *RegularExpression::compile(
        R"((?<![\d.,])(\d{2,3}(?:[.,]\d+)?)[\s_-]?bpm(?![\p{L}\d]))", RegularExpression::Case::insensitive);
    std::optional<double> namedTempo;  // of the item at hand, as its names state it
    std::optional<int> namedBeats;
    std::shared_ptr<const HeardSound> heard;

    void addAllTaggings(IndexedItem& item, const std::shared_ptr<ContentItem>& content,
                        const TGRTMetaData* record, const Taggings& withVirtual) {
        auto report = reportOf(content);
        Taggings known;
        const auto add = [&](const Taggings& taggings, Provenance provenance) {
            addTaggings(item, known, report ? report->withoutRejected(taggings) : taggings, provenance);
        };
        if (record != nullptr) add(record->taggings(), Provenance::stored);
        add(withVirtual, Provenance::virtualTag);
        if (report) return addDecided(item, known, *std::move(report));
        for (const auto& [name, option] : kTaggingServiceNames) {
            if ((services & option) == 0) continue;
            addTaggings(item, known, aggregator->taggingsOfItem(content, *taxonomyOfServices, option),
                        Provenance::automatic, name);
        }
    }

    /// The folder that was indexed, of several the innermost.
    std::string_view rootOf(std::string_view path) const {
        std::string_view root;
        for (const std::string& folder : folders) {
            const bool isBelow =
                path.starts_with(folder) && folder.size() < path.size() && path[folder.size()] == '/';
            if (isBelow && folder.size() > root.size()) root = folder;
        }
        return root;
    }

    /// Nothing unless names are among the services: then all that they say holds.
    std::optional<ItemReport> reportOf(const std::shared_ptr<ContentItem>& content) {
        if ((services & QVCTAutoTaggingOptionNames) == 0) return std::nullopt;
        const std::string path = content->url().path();
        ItemReport report = tagger.report(content, ItemNames(path, rootOf(path)), services);
        namedTempo = report.tempo;
        namedBeats = report.beats;
        return report;
    }

    void addDecided(IndexedItem& item, Taggings& known, ItemReport report) {
        Explanation explanation;
        explanation.isWhole = true;
        explanation.kind = report.kind;
        explanation.tempo = report.tempo;
        explanation.isTempoFromLength = report.isTempoFromLength;
        explanation.beats = report.beats;
        explanation.dropped = std::move(report.resolution.dropped);
        for (HeldTag& held : report.resolution.held) {
            const auto tagging = held.tagging();
            if (!tagging) continue;
            const bool isNew = known.insert(tagging);
            const std::size_t place = isNew ? item.taggings.size() : placeOf(*tagging, item);
            const std::string_view service =
                held.claims.empty() ? std::string_view() : held.claims.front().service;
            if (isNew) item.taggings.push_back(indexed(*tagging, Provenance::automatic, service));
            if (place < item.taggings.size())
                explanation.held.push_back({place, held.confidence, std::move(held.claims)});
        }
        item.explanation = encodedExplanation(explanation, item.path);
    }

    void addHeardTempo(IndexedItem& item) const {
        constexpr double kLikely = 0.5;
        if (heard && !heard->tempos.empty() && heard->tempos.front().confidence >= kLikely)
            addNumber(item, "Tempo", roundedTo(heard->tempos.front().bpm, 100));
    }

    static void addForm(IndexedItem& item, const LCAudioFacts& facts) {
        if (facts.sampleRate <= 0) return;
        addNumber(item, QVContentKeyLengthInSeconds,
                  static_cast<double>(facts.frameCount) / facts.sampleRate);
        addNumber(item, kSampleRateKey, facts.sampleRate);
        if (facts.bitsPerSample > 0) addNumber(item, kBitDepthKey, facts.bitsPerSample);
        addNumber(item, kChannelCountKey, facts.channelCount);
    }

    void addSound(IndexedItem& item) const {
        if (!heard) return;
        if (heard->likeness) item.likeness = encodedLikeness(*heard->likeness);
        item.fingerprint = encodedFingerprint(heard->fingerprint);
    }

    /// In few steps, so that few groups of numbers have them all.
    void addHeard(IndexedItem& item) const {
        if (!heard) return;
        for (const auto& trait : heard->traits) {
            const auto field = std::find_if(kTraitFields.begin(), kTraitFields.end(),
                                            [&](const auto& its) { return its.scale == trait.scale; });
            if (field == kTraitFields.end()) continue;
            const double level = field->isOfFirstPole ? 1 - trait.level : trait.level;
            addNumber(item, field->key, roundedTo(level, 100));
        }
        if (heard->loudness) addNumber(item, "Loudness", roundedTo(*heard->loudness, 10));
        if (heard->truePeak) addNumber(item, "TruePeak", roundedTo(*heard->truePeak, 10));
        constexpr double kLikely = 0.5;
        if (!heard->note || heard->note->confidence < kLikely) return;
        addNumber(item, "Note", heard->note->number);
        addNumber(item, "Cents", roundedTo(heard->note->cents, 1));
    }

    void addTempoAndBeats(IndexedItem& item, const LCFileData* file, const std::string& fileName) {
        if (file != nullptr) {
            addNumber(item, QVContentKeyBeatCount, file->beatCount());
            if (file->bpm() > 0) addNumber(item, "Tempo", double{file->bpm()});
        }
        if (namedBeats) addNumber(item, QVContentKeyBeatCount, *namedBeats);
        if (hasValue(item, "Tempo")) return;
        if (namedTempo) return addNumber(item, "Tempo", *namedTempo);
        addHeardTempo(item);
        if (hasValue(item, "Tempo")) return;
        const std::u16string text = utf16FromUtf8(fileName);
        const auto match = tempoInName.firstMatch(text);
        if (match.size() < 2) return;
        const auto number = std::u16string_view(text).substr(match[1].start, match[1].end - match[1].start);
        addNumber(item, "Tempo", leadingNumber(replaceAll(utf8FromUtf16(number), ",", ".")));
    }
};

ContentDescriber::ContentDescriber(std::uint64_t services, const std::vector<std::string>& folders)
    : implementation_(std::make_unique<Implementation>(services, folders)) {}

ContentDescriber::~ContentDescriber() = default;

std::uint64_t ContentDescriber::digest(std::uint64_t services) {
    // Raised when a change makes items be described differently although the version stays the same.
    constexpr std::uint64_t edition = 9;
    Digest digest;
    digest.add(services);
    digest.add(version());
    digest.add(edition);
    for (const ResourceFile& resource : resourceFiles()) {
        const auto path = replacementFile(resource);
        const auto bytes = path ? readFile(*path) : std::nullopt;
        if (!bytes) continue;
        digest.add(resource.name);
        digest.add(textOf(*bytes));
    }
    return digest.value();
}

std::optional<IndexedItem> ContentDescriber::describe(const std::string& path, Error* error) {
    Implementation& its = *implementation_;
    const URL url = URL::fileURLWithPath(path);
    const auto content = std::make_shared<ContentItem>(
        url, ContentItem::Reading{Implementation::kOptions, its.taxonomyOfRecords, its.needsXmlDocument()});
    Error reason;
    const auto record = content->record(&reason);
    if (reason.isSet() && reason.code != kErrorNoContent) {
        if (error != nullptr) *error = reason;
        return std::nullopt;
    }
    const auto object = TGRTIndexableContentObject::indexableContentObjectForMetaData(record.get(), url,
                                                                                      *its.taxonomyOfRecords);
    IndexedItem item;
    item.path = path;
    item.name = url.lastPathComponentWithoutExtension();
    if (object->displayName() != item.name) item.title = object->displayName();
    item.fileType = object->fileType();
    if (item.fileType == kFileTypeNone) item.fileType = QVContentTaggingTypes::fallBackFileTypeForURL(url);
    item.subFileType = object->subFileType();
    item.previewAvailable = object->previewAvailable();
    item.packs.assign(object->packageIdentifiers().begin(), object->packageIdentifiers().end());
    for (const auto& dependency : object->dependencyItems())
        item.dependencies.push_back({dependency->UUID(), dependency->path()});
    its.namedTempo.reset();
    its.namedBeats.reset();
    its.addAllTaggings(item, content, record.get(), object->taggingDatas());
    its.heard = content->file().heardSound();
    addValues(item, object->valueDatas());
    its.addTempoAndBeats(item, content->fileData().get(), url.lastPathComponent());
    if (const auto file = content->fileData()) Implementation::addForm(item, file->facts());
    its.addHeard(item);
    its.addSound(item);
    item.payloadHash = payloadHash(*content);
    return item;
}

}  // namespace qvct::contentdb
