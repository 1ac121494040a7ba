#include "media/loopfile/LCFileData.h"

#include "media/loopfile/RecordKeys.h"
#include "media/loopfile/containers/MusicValues.h"

#include <algorithm>
#include <bit>
#include <limits>
#include <utility>

namespace qvct {
namespace {

// Keys of the record beside those that other files of the framework use too.
constexpr std::string_view kTempo = "Tempo";
constexpr std::string_view kDescriptors = "Descriptors";
constexpr std::string_view kInstrumentType = "InstrumentType";
constexpr std::string_view kInstrumentSubType = "InstrumentSubType";
constexpr std::string_view kGenre = "Genre";
constexpr std::string_view kMidiData = "MidiData";
constexpr std::string_view kTransientMarkers = "TransientMarkers";

constexpr int kLargest = std::numeric_limits<int>::max();

}  // namespace

LCFileData::LCFileData(LCAudioFacts facts, std::optional<Dictionary> record)
    : facts_(std::move(facts)), hasRecord_(record.has_value()) {
    if (record) record_ = *std::move(record);
}

std::shared_ptr<LCFileData> LCFileData::withFacts(LCAudioFacts facts) const {
    auto result = std::make_shared<LCFileData>(*this);
    result->facts_ = std::move(facts);
    return result;
}

std::optional<double> LCFileData::number(std::string_view key, double lowest, double highest) const {
    const PropertyList* value = record_.value(key);
    if (value == nullptr || !value->isNumber()) return std::nullopt;
    const std::optional<double> number = value->doubleValue();
    return number && *number >= lowest && *number <= highest ? number : std::nullopt;
}

int LCFileData::integer(std::string_view key, int lowest, int highest, int otherwise) const {
    return static_cast<int>(number(key, lowest, highest).value_or(otherwise));
}

void LCFileData::setInteger(std::string_view key, int value, int current) {
    if (value != current) record_.set(key, value);
}

float LCFileData::real(std::string_view key, double highest, float otherwise) const {
    return static_cast<float>(number(key, 0, highest).value_or(otherwise));
}

std::optional<std::string> LCFileData::text(std::string_view key) const {
    const std::string* string = record_.string(key);
    return string == nullptr ? std::nullopt : std::optional(*string);
}

void LCFileData::setText(std::string_view key, std::optional<std::string> value) {
    if (value == text(key)) return;
    if (value) {
        record_.set(key, *std::move(value));
    } else {
        record_.remove(key);
    }
}

bool LCFileData::hasLoopTypeChunks() const {
    return facts_.isLoop || integer(QVContentKeyTavioLoopType, -1, kLargest, -1) >= 0;
}

const LCFileData::Dictionary& LCFileData::taggingDictionary() const {
    static const Dictionary none;
    const Dictionary* dictionary = record_.dictionary(QVContentTaggingKeyName);
    return dictionary == nullptr ? none : *dictionary;
}

void LCFileData::setTaggingDictionary(Dictionary value) {
    record_.remove(QVContentTaggingUUIDKeyName);
    record_.set(QVContentTaggingKeyName, std::move(value));
}

const LCFileData::Dictionary* LCFileData::contentInfoDictionary() const {
    return record_.dictionary(QVContentInfoKey);
}

void LCFileData::setContentInfoDictionary(Dictionary value) {
    record_.set(QVContentInfoKey, std::move(value));
}

void LCFileData::setRejectedLabels(std::optional<PropertyList> value) {
    if (value) {
        record_.set(QVContentTaggingRejectedKeyName, *std::move(value));
    } else {
        record_.remove(QVContentTaggingRejectedKeyName);
    }
}

std::string LCFileData::displayName() const {
    return text(QVContentTaggingDisplayKeyName).value_or(facts_.displayName);
}

void LCFileData::setDisplayName(std::string_view value) {
    if (value != displayName()) record_.set(QVContentTaggingDisplayKeyName, value);
}

int LCFileData::tavioLoopType() const {
    const int withoutRecord = !facts_.isLoop ? -1 : midiData().empty() ? 0 : 1;
    return integer(QVContentKeyTavioLoopType, -1, kLargest, withoutRecord);
}

void LCFileData::setTavioLoopType(int value) {
    setInteger(QVContentKeyTavioLoopType, value, tavioLoopType());
}

int LCFileData::beatCount() const {
    return integer(QVContentKeyBeatCount, 0, kMostBeats, facts_.beatCount);
}

void LCFileData::setBeatCount(int value) {
    setInteger(QVContentKeyBeatCount, value, beatCount());
}

int LCFileData::midiRootNote() const {
    return integer(QVContentKeyMidiRootNote, -1, 127, facts_.midiRootNote);
}

void LCFileData::setMidiRootNote(int value) {
    setInteger(QVContentKeyMidiRootNote, value, midiRootNote());
}

int LCFileData::keyType() const {
    return integer(QVContentKeyKeyType, 0, 4, facts_.keyType);
}

void LCFileData::setKeyType(int value) {
    setInteger(QVContentKeyKeyType, value, keyType());
}

int LCFileData::signatureTop() const {
    return integer(QVContentKeySignatureTop, 0, kLargestSignature, facts_.signatureTop);
}

void LCFileData::setSignatureTop(int value) {
    setInteger(QVContentKeySignatureTop, value, signatureTop());
}

int LCFileData::signatureBottom() const {
    const int bottom = integer(QVContentKeySignatureBottom, 0, kLargestSignature, facts_.signatureBottom);
    const bool isNoteValue = bottom == 0 || std::has_single_bit(static_cast<unsigned>(bottom));
    return isNoteValue ? bottom : facts_.signatureBottom;
}

void LCFileData::setSignatureBottom(int value) {
    setInteger(QVContentKeySignatureBottom, value, signatureBottom());
}

float LCFileData::bpm() const {
    return real(kTempo, kFastestTempo, facts_.bpm);
}

void LCFileData::setBpm(float value) {
    if (value != bpm()) record_.set(kTempo, double{value});
}

float LCFileData::lengthInSeconds() const {
    if (facts_.lengthInSeconds > 0) return facts_.lengthInSeconds;
    return real(QVContentKeyLengthInSeconds, kLongestSeconds, 0);
}

void LCFileData::setLengthInSeconds(float value) {
    if (value != lengthInSeconds()) record_.set(QVContentKeyLengthInSeconds, double{value});
}

std::set<std::string> LCFileData::descriptors() const {
    const PropertyList::Array* items = record_.array(kDescriptors);
    if (items == nullptr) return facts_.descriptors;
    std::set<std::string> result;
    for (const PropertyList& item : *items) {
        if (const std::string* word = item.string()) result.insert(*word);
    }
    return result;
}

void LCFileData::setDescriptors(const std::set<std::string>& value) {
    if (value != descriptors()) record_.set(kDescriptors, PropertyList::Array(value.begin(), value.end()));
}

std::optional<std::string> LCFileData::instrumentTypeTag() const {
    return text(kInstrumentType);
}

void LCFileData::setInstrumentTypeTag(std::optional<std::string> value) {
    setText(kInstrumentType, std::move(value));
}

std::optional<std::string> LCFileData::instrumentSubTypeTag() const {
    return text(kInstrumentSubType);
}

void LCFileData::setInstrumentSubTypeTag(std::optional<std::string> value) {
    setText(kInstrumentSubType, std::move(value));
}

std::optional<std::string> LCFileData::genreTag() const {
    return text(kGenre);
}

void LCFileData::setGenreTag(std::optional<std::string> value) {
    setText(kGenre, std::move(value));
}

const PropertyList::Data& LCFileData::midiData() const {
    const PropertyList::Data* data = record_.data(kMidiData);
    return data == nullptr ? facts_.midiData : *data;
}

void LCFileData::setMidiData(PropertyList::Data value) {
    if (value != midiData()) record_.set(kMidiData, std::move(value));
}

std::vector<std::int64_t> LCFileData::transientMarkers() const {
    const PropertyList::Array* items = record_.array(kTransientMarkers);
    if (items == nullptr) return facts_.transientMarkers;
    const bool isLengthKnown = facts_.frameCount > 0;
    const std::int64_t lastFrame = isLengthKnown ? static_cast<std::int64_t>(facts_.frameCount) : INT64_MAX;
    std::vector<std::int64_t> frames;
    for (const PropertyList& item : *items) {
        const std::int64_t* frame = item.signedInteger();
        if (frame != nullptr && *frame >= 0 && *frame <= lastFrame) frames.push_back(*frame);
    }
    std::sort(frames.begin(), frames.end());
    return frames;
}

void LCFileData::setTransientMarkers(const std::vector<std::int64_t>& value) {
    if (value != transientMarkers()) {
        record_.set(kTransientMarkers, PropertyList::Array(value.begin(), value.end()));
    }
}

}  // namespace qvct
