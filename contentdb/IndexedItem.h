#pragma once

#include "platform/base/Error.h"
#include "platform/base/Export.h"

#include <cstdint>
#include <functional>
#include <memory>
#include <optional>
#include <string>
#include <string_view>
#include <variant>
#include <vector>

namespace qvct::contentdb {

/// Where a tagging comes from.
enum class Provenance : std::uint8_t {
    stored,      ///< in the item's own metadata record
    virtualTag,  ///< derived from the record: file type, key, time signature
    automatic    ///< found by a tagging service
};

/// One tag of one item, as the index keeps it.
struct IndexedTagging {
    std::string label;
    std::string category;
    /// Labels of the tags above it, nearest first. A search for one of them finds the item too.
    std::vector<std::string> ancestors;
    /// Weight in [0, 1].
    std::optional<float> level;
    Provenance provenance = Provenance::stored;
    /// The tagging service that found it; empty unless it is automatic.
    std::string service;
    /// A service made it, now or before it was stored.
    bool isAuto = false;

    bool operator==(const IndexedTagging&) const = default;
};

/// One key value of one item.
struct IndexedValue {
    std::string key;
    std::variant<double, std::string> value;

    bool operator==(const IndexedValue&) const = default;
};

/// @{
/// Key of a value that says how a sound is stored: frames a second; bits a sample, where its coding has such
/// a number; channels.
inline constexpr std::string_view kSampleRateKey = "SampleRate";
inline constexpr std::string_view kBitDepthKey = "BitDepth";
inline constexpr std::string_view kChannelCountKey = "ChannelCount";
/// @}

/// A file that the item needs.
struct IndexedDependency {
    std::string uuid;
    std::string path;

    bool operator==(const IndexedDependency&) const = default;
};

/// What tells whether a file has changed. Times are nanoseconds since 1970.
struct ItemStamp {
    std::uint64_t size = 0;
    std::int64_t modified = 0;
    std::int64_t changed = 0;
    std::uint64_t inode = 0;

    bool operator==(const ItemStamp&) const = default;
};

/// Everything that the content database knows of one item.
struct IndexedItem {
    /// Absolute, byte for byte: names need not be UTF-8.
    std::string path;
    /// Hash of the audio or content alone, so that an item that was moved or retagged is recognised. Empty
    /// when unknown.
    std::string payloadHash;
    ItemStamp stamp;

    /// As the file is called, without its extension.
    std::string name;
    /// The name that its record gives it; empty when there is none, or it is the file's.
    std::string title;
    std::int64_t fileType = 0;
    std::int64_t subFileType = 0;
    bool previewAvailable = false;
    std::vector<IndexedTagging> taggings;
    /// Why the services' taggings hold, for `explanationOf`, in a form that is the database's own. Empty when
    /// the describer does not say.
    std::string explanation;
    /// Numbers under the keys of the record ("BeatCount", "MidiRootNote", ...) and "Tempo" in beats a minute.
    std::vector<IndexedValue> values;
    std::vector<std::string> packs;
    std::vector<IndexedDependency> dependencies;
    /// Where its sound lies among all sounds, and what tells copies of it, in forms that are the database's
    /// own. Empty when nobody listened.
    std::string likeness;
    std::string fingerprint;
    /// Why the item could not be read, without its path; then nothing below `stamp` is known, and no search
    /// finds it.
    std::string failure;

    bool operator==(const IndexedItem&) const = default;
};

/// The error of an item that could not be read.
QVCT_API Error errorOfFailure(const IndexedItem& item);

/// Describes one item at a time: a pure function of what lies at the path.
class ItemDescriber {
  public:
    virtual ~ItemDescriber() = default;
    /// The item, or nothing and an error with the reason. Path and stamp are filled in by the caller.
    virtual std::optional<IndexedItem> describe(const std::string& path, Error* error) = 0;
};

/// Makes a describer of its own for each worker, inside the worker's process or thread.
using DescriberFactory = std::function<std::unique_ptr<ItemDescriber>()>;

}  // namespace qvct::contentdb
