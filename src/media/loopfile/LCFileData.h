#pragma once

#include "platform/data/PropertyList.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

namespace qvct {

class RandomAccessReader;

/// What an audio file says about itself outside of our own record: its format, and the music in the chunks
/// that other makers write.
struct LCAudioFacts {
    double sampleRate = 0;  ///< Frames a second; 0 in a file without audio.
    std::uint64_t frameCount = 0;
    std::uint32_t channelCount = 0;
    std::uint32_t bitsPerSample = 0;  ///< 0 where the coding has no such number.
    std::uint64_t audioOffset = 0;    ///< Of the sound's bytes in the file.
    std::uint64_t audioSize = 0;      ///< Of the sound in bytes, as far as the file reaches; 0 for none.

    bool isLoop = false;        ///< A chunk of another maker says so.
    bool isAuthored = false;    ///< That chunk is one that only an editor of loops writes.
    float bpm = 0;              ///< Quarter notes a minute; 0 is unknown.
    float lengthInSeconds = 0;  ///< 0 is unknown.
    int beatCount = 0;          ///< 0 is unknown.
    int midiRootNote = -1;      ///< 0 to 127; -1 is unknown.
    int keyType = 0;            ///< 0 any, 1 minor, 2 major, 3 neither, 4 both.
    int signatureTop = 0;       ///< 0 is unknown.
    int signatureBottom = 0;
    std::string displayName;
    std::set<std::string> descriptors;
    PropertyList::Data midiData;                 ///< A standard MIDI file.
    std::vector<std::int64_t> transientMarkers;  ///< Frames, ascending.
};

/// What a loop or plain audio file says: our record, and where that is silent the facts of the file itself.
///
/// A setter that changes a value writes it into the record. Setting the value that is already in effect
/// leaves the record as it is, so that a rewrite does not copy what other makers' chunks say into it. Keys of
/// the record that this class does not know survive, and so does the order of the keys. Values of a wrong
/// type or out of range in a record count as absent. Not thread-safe while it is changed.
class LCFileData {
  public:
    using Dictionary = PropertyList::Dictionary;

    LCFileData() = default;
    /// No record means that the file has none yet.
    LCFileData(LCAudioFacts facts, std::optional<Dictionary> record);

    /// Whether a person or program described the file: it holds our record, or a loop editor's chunk.
    bool hasAuthoredChunks() const { return hasRecord_ || facts_.isAuthored; }
    /// Whether the record has a loop type, or a chunk of another maker says that the file is a loop.
    bool hasLoopTypeChunks() const;

    /// Empty when there is none. Setting one removes the record's identifier, which named the former
    /// contents.
    const Dictionary& taggingDictionary() const;
    void setTaggingDictionary(Dictionary value);
    /// Null when there is none.
    const Dictionary* contentInfoDictionary() const;
    void setContentInfoDictionary(Dictionary value);
    /// Labels of tags that a person rejected, an array as the record holds it; nothing removes it.
    void setRejectedLabels(std::optional<PropertyList> value);
    std::string displayName() const;
    void setDisplayName(std::string_view value);

    /// -1 no loop, 0 a loop of audio only, above 0 a loop that holds MIDI.
    int tavioLoopType() const;
    void setTavioLoopType(int value);
    /// 0 is unknown.
    int beatCount() const;
    void setBeatCount(int value);
    /// 0 to 127; -1 is unknown.
    int midiRootNote() const;
    void setMidiRootNote(int value);
    /// 0 any, 1 minor, 2 major, 3 neither, 4 both.
    int keyType() const;
    void setKeyType(int value);
    /// 0 is unknown.
    int signatureTop() const;
    void setSignatureTop(int value);
    int signatureBottom() const;
    void setSignatureBottom(int value);
    /// Quarter notes a minute; 0 is unknown. Always finite.
    float bpm() const;
    void setBpm(float value);
    /// In plain file data it comes from the record only; in enhanced data the file's header takes precedence
    /// over the record. 0 is unknown.
    float lengthInSeconds() const;
    void setLengthInSeconds(float value);

    std::set<std::string> descriptors() const;
    void setDescriptors(const std::set<std::string>& value);
    std::optional<std::string> instrumentTypeTag() const;
    void setInstrumentTypeTag(std::optional<std::string> value);
    std::optional<std::string> instrumentSubTypeTag() const;
    void setInstrumentSubTypeTag(std::optional<std::string> value);
    std::optional<std::string> genreTag() const;
    void setGenreTag(std::optional<std::string> value);

    /// The embedded standard MIDI file; empty when there is none.
    const PropertyList::Data& midiData() const;
    void setMidiData(PropertyList::Data value);
    /// Frames, ascending.
    std::vector<std::int64_t> transientMarkers() const;
    void setTransientMarkers(const std::vector<std::int64_t>& value);

    double sampleRate() const { return facts_.sampleRate; }
    std::uint64_t frameCount() const { return facts_.frameCount; }
    std::uint32_t channelCount() const { return facts_.channelCount; }
    std::uint32_t bitsPerSample() const { return facts_.bitsPerSample; }

    /// The record as it is to be stored, and the facts that apply where it is silent.
    const Dictionary& record() const { return record_; }
    const LCAudioFacts& facts() const { return facts_; }
    /// The same record combined with other facts.
    std::shared_ptr<LCFileData> withFacts(LCAudioFacts facts) const;

    /// The file that this was read from, so that nobody who needs more of it has to open it again. Null once
    /// nothing holds it open any more.
    std::shared_ptr<const RandomAccessReader> openFile() const { return file_.lock(); }
    void setOpenFile(std::weak_ptr<const RandomAccessReader> file) { file_ = std::move(file); }

  private:
    std::optional<double> number(std::string_view key, double lowest, double highest) const;
    int integer(std::string_view key, int lowest, int highest, int otherwise) const;
    void setInteger(std::string_view key, int value, int current);
    float real(std::string_view key, double highest, float otherwise) const;
    std::optional<std::string> text(std::string_view key) const;
    void setText(std::string_view key, std::optional<std::string> value);

    LCAudioFacts facts_;
    Dictionary record_;
    bool hasRecord_ = false;
    std::weak_ptr<const RandomAccessReader> file_;
};

}  // namespace qvct
