#include "autotagging/Contradictions.h"

#include "autotagging/ContentItem.h"
#include "autotagging/ItemTagger.h"
#include "listening/HeardSound.h"
#include "listening/instrument/InstrumentModel.h"
#include "media/loopfile/LCFileData.h"
#include "metadata/TGRTMetaData.h"
#include "resources/DefaultListeningModels.h"
#include "taxonomy/TGRTTagging.h"
#include "taxonomy/TaggingTypes.h"

#include <algorithm>
#include <cmath>
#include <initializer_list>
#include <iterator>
#include <optional>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

using Statement = Contradiction::Statement;

constexpr std::string_view kRecord = "record", kFile = "file", kName = "name", kSound = "sound";

/// From which confidence on a sound speaks against what is written. Keys and tempos are often heard as one
/// that is near to them.
constexpr double kClear = 0.9, kClearMusic = 0.8;

struct Key {
    int tonic = 0;  // semitones above C
    std::optional<bool> isMinor;
    Statement statement;
};

std::string textOfKey(int tonic, std::optional<bool> isMinor) {
    constexpr std::string_view kNotes[] = {"C", "C#", "D", "D#", "E", "F", "F#", "G", "G#", "A", "A#", "B"};
    return fmt::format("{}{}", kNotes[tonic], !isMinor ? "" : *isMinor ? " minor" : " major");
}

Key keyOf(int tonic, std::optional<bool> isMinor, std::string_view source, double confidence) {
    return {tonic, isMinor, {textOfKey(tonic, isMinor), source, confidence}};
}

/// The key that tags tell.
std::optional<Key> keyIn(const std::vector<std::string_view>& labels, std::string_view source,
                         double confidence) {
    const auto key =
        std::find_first_of(QVTagsOfKeys.begin(), QVTagsOfKeys.end(), labels.begin(), labels.end());
    if (key == QVTagsOfKeys.end()) return std::nullopt;
    const auto has = [&labels](std::string_view label) {
        return std::find(labels.begin(), labels.end(), label) != labels.end();
    };
    std::optional<bool> isMinor;
    if (has(QVTagMinorKeyType) != has(QVTagMajorKeyType)) isMinor = has(QVTagMinorKeyType);
    return keyOf(static_cast<int>(key - QVTagsOfKeys.begin()), isMinor, source, confidence);
}

/// Whether both can be meant by one who counts a relative key or the other mode as the same.
bool agree(const Key& a, const Key& b) {
    constexpr int kOctave = 12, kFromMinorToMajor = 3;
    if (a.tonic == b.tonic) return true;
    const auto isRelative = [](const Key& minor, const Key& major) {
        return minor.isMinor.value_or(true) && !major.isMinor.value_or(false) &&
               (minor.tonic + kFromMinorToMajor) % kOctave == major.tonic;
    };
    return isRelative(a, b) || isRelative(b, a);
}

/// The same tempo, or one that people count as well: twice as fast, in triplets.
bool isMultiple(double tempo, double other, double tolerance) {
    constexpr std::pair<int, int> kRatios[] = {{1, 1}, {2, 1}, {3, 1}, {4, 1}, {3, 2}, {4, 3}};
    return std::any_of(std::begin(kRatios), std::end(kRatios), [&](const std::pair<int, int>& ratio) {
        const double factor = double(ratio.first) / ratio.second;
        return std::abs(std::log(tempo * factor / other)) < tolerance ||
               std::abs(std::log(tempo / factor / other)) < tolerance;
    });
}

Statement tempoStatement(double tempo, std::string_view source, double confidence = 1) {
    return {fmt::format("{:.4g} bpm", tempo), source, confidence};
}

class Search {
  public:
    Search(ContentItem& item, const ItemReport& report, const TGRTTaxonomy& taxonomy)
        : file_(item.fileData()), record_(item.record()), report_(report), taxonomy_(taxonomy) {}

    std::vector<Contradiction> run() {
        compareTempos();
        compareLength();
        compareKeys();
        compareRootNote();
        compareInstruments();
        compareKinds();
        return std::move(found_);
    }

  private:
    void add(std::string_view subject, Statement stated, Statement against) {
        found_.push_back({subject, std::move(stated), std::move(against)});
    }

    double tempoOfFile() const { return file_ ? double{file_->bpm()} : 0; }

    void compareTempos() {
        constexpr double kSame = 0.01, kHeardSame = 0.03;
        const double ofFile = tempoOfFile();
        const double ofName = report_.tempo.value_or(0);
        if (ofFile > 0 && ofName > 0 && !isMultiple(ofName, ofFile, kSame))
            add("tempo", tempoStatement(ofFile, kFile), tempoStatement(ofName, kName));
        const double stated = ofFile > 0 ? ofFile : ofName;
        if (stated <= 0 || !report_.sound || report_.sound->tempos.empty()) return;
        const auto& tempos = report_.sound->tempos;
        const auto& likeliest = tempos.front();
        const bool isPossible = std::any_of(
            tempos.begin(), tempos.end(),
            [&](const HeardSound::Tempo& tempo) { return isMultiple(tempo.bpm, stated, kHeardSame); });
        if (likeliest.confidence >= kClearMusic && !isPossible)
            add("tempo", tempoStatement(stated, ofFile > 0 ? kFile : kName),
                tempoStatement(likeliest.bpm, kSound, likeliest.confidence));
    }

    /// A loop is as long as its beats, or a little longer where it rings on.
    void compareLength() {
        constexpr double kShorter = 0.02, kSecondsOfMinute = 60, kRingingBeats = 4;
        const double tempo = tempoOfFile() > 0 ? tempoOfFile() : report_.tempo.value_or(0);
        const int beats = file_ && file_->beatCount() > 0 ? file_->beatCount() : report_.beats.value_or(0);
        const double seconds = file_ ? double{file_->lengthInSeconds()} : 0;
        if (tempo <= 0 || beats <= 0 || seconds <= 0) return;
        const double heardBeats = seconds * tempo / kSecondsOfMinute;
        if (heardBeats >= beats * (1 - kShorter) && heardBeats <= beats + kRingingBeats) return;
        const auto text = [](double count) { return fmt::format("{:.3g} beats", count); };
        const bool isOfFile = file_->beatCount() > 0;
        add("length", {text(beats), isOfFile ? kFile : kName}, {text(heardBeats), kSound});
    }

    std::vector<std::string_view> labelsOfRecord() const {
        std::vector<std::string_view> labels;
        if (!record_) return labels;
        for (const auto& tagging : record_->taggings())
            if (!tagging->isAutoTagging()) labels.push_back(tagging->label());
        return labels;
    }

    static bool isNamed(const HeldTag& held) {
        return std::any_of(held.claims.begin(), held.claims.end(), [](const TagClaim& claim) {
            return claim.service != kSound && claim.doubt.empty();
        });
    }

    std::optional<Key> keyOfNames() const {
        std::vector<std::string_view> labels;
        double confidence = 1;
        for (const HeldTag& held : report_.resolution.held) {
            if (!isNamed(held)) continue;
            labels.push_back(held.tag->label());
            const auto& keys = QVTagsOfKeys;
            if (std::find(keys.begin(), keys.end(), labels.back()) != keys.end())
                confidence = held.confidence;
        }
        return keyIn(labels, kName, confidence);
    }

    /// Of a loop the root note is that of its key.
    std::optional<Key> keyOfFile() const {
        constexpr int kMinor = 1, kMajor = 2, kOctave = 12;
        if (!file_ || file_->midiRootNote() < 0) return std::nullopt;
        const int type = file_->keyType();
        if (type != kMinor && type != kMajor) return std::nullopt;
        return keyOf(file_->midiRootNote() % kOctave, type == kMinor, kFile, 1);
    }

    std::optional<Key> keyOfSound() const {
        if (!report_.sound || !report_.sound->key) return std::nullopt;
        const auto& [tonic, isMinor, confidence] = *report_.sound->key;
        if (confidence < kClearMusic) return std::nullopt;
        return keyOf(tonic, isMinor, kSound, confidence);
    }

    /// Each against the one that outranks the others.
    void compareKeys() {
        std::optional<Key> stated;
        for (auto& key : {keyIn(labelsOfRecord(), kRecord, 1), keyOfFile(), keyOfNames(), keyOfSound()}) {
            if (!key) continue;
            if (!stated) {
                stated = key;
            } else if (!agree(*stated, *key)) {
                add("key", stated->statement, key->statement);
            }
        }
    }

    /// A sampler tunes a sound by its root note; which octave is called 4 is not agreed on.
    void compareRootNote() {
        constexpr int kOctave = 12, kUsualIfUnknown = 60;
        const int root = file_ ? file_->midiRootNote() : -1;
        if (root < 0 || root == kUsualIfUnknown || !report_.sound || !report_.sound->note) return;
        const auto& note = *report_.sound->note;
        if (note.confidence < kClear || (note.number - root) % kOctave == 0) return;
        const auto text = [](int number) { return textOfKey((number % kOctave + kOctave) % kOctave, {}); };
        add("root note", {text(root), kFile}, {text(note.number), kSound, note.confidence});
    }

    static bool isOrIsAbove(const TGRTTag& above, const TGRTTag& tag) {
        if (above.label() == tag.label()) return true;
        for (auto parent = tag.parent(); parent; parent = parent->parent())
            if (parent->label() == above.label()) return true;
        return false;
    }

    /// The nearest tag that can be heard: a cabasa is heard as percussion.
    static std::shared_ptr<TGRTTag> heardAs(std::shared_ptr<TGRTTag> tag) {
        const auto model = defaultInstrumentModel();
        const auto isKnown = [&model](const std::string& label) {
            for (std::size_t i = 0; i < model->classes(); ++i)
                if (model->label(i) == label) return true;
            return false;
        };
        while (!isKnown(tag->label()) && tag->parent()) tag = tag->parent();
        return tag;
    }

    struct Instrument {
        std::shared_ptr<TGRTTag> tag;
        Statement statement;
    };

    /// Of the record, else of the names.
    std::vector<Instrument> statedInstruments() const {
        std::vector<Instrument> instruments;
        const auto addTag = [&](std::shared_ptr<TGRTTag> tag, std::string_view source, double confidence) {
            if (!tag || tag->categoryIdentifier() != QVCategorySourceIdentifier) return;
            Statement statement{tag->label(), source, confidence};
            instruments.push_back({std::move(tag), std::move(statement)});
        };
        for (const std::string_view label : labelsOfRecord())
            addTag(taxonomy_.findTagForLabel(label), kRecord, 1);
        if (!instruments.empty()) return instruments;
        for (const HeldTag& held : report_.resolution.held)
            if (isNamed(held)) addTag(held.tag, kName, held.confidence);
        return instruments;
    }

    static bool isAboveAnother(const Instrument& instrument, const std::vector<Instrument>& all) {
        return std::any_of(all.begin(), all.end(), [&](const Instrument& other) {
            return other.tag->label() != instrument.tag->label() && isOrIsAbove(*instrument.tag, *other.tag);
        });
    }

    void compareInstruments() {
        if (!report_.sound || report_.sound->instruments.empty() || report_.kind == SoundKind::loop) return;
        const auto& [label, confidence] = report_.sound->instruments.front();
        const auto heard = taxonomy_.findTagForLabel(label);
        if (!heard || confidence < kClear || !report_.rejections.reasonFor(*heard).empty()) return;
        const std::vector<Instrument> stated = statedInstruments();
        const Instrument* contradicted = nullptr;
        for (const Instrument& instrument : stated) {
            if (isAboveAnother(instrument, stated)) continue;
            const auto tag = heardAs(instrument.tag);
            if (isOrIsAbove(*tag, *heard) || isOrIsAbove(*heard, *tag)) return;
            if (contradicted == nullptr) contradicted = &instrument;
        }
        if (contradicted != nullptr)
            add("instrument", contradicted->statement, {heard->label(), kSound, confidence});
    }

    void compareKinds() {
        if (!report_.sound || !report_.sound->loopConfidence) return;
        const double loop = *report_.sound->loopConfidence;
        if (report_.kind == SoundKind::loop && loop <= 1 - kClear) {
            add("kind", {"loop", kName}, {"one-shot", kSound, 1 - loop});
        } else if (report_.kind == SoundKind::oneShot && loop >= kClear) {
            add("kind", {"one-shot", kName}, {"loop", kSound, loop});
        }
    }

    std::shared_ptr<LCFileData> file_;
    std::shared_ptr<TGRTMetaData> record_;
    const ItemReport& report_;
    const TGRTTaxonomy& taxonomy_;
    std::vector<Contradiction> found_;
};

}  // namespace

std::vector<Contradiction> contradictionsIn(ContentItem& item, const ItemReport& report,
                                            const TGRTTaxonomy& taxonomy) {
    return Search(item, report, taxonomy).run();
}

}  // namespace qvct
