#pragma once

#include <string_view>

// Keys of the metadata record, which every kind of file stores.
namespace qvct {

/// @{
/// Key of a metadata record.
inline constexpr std::string_view QVContentTaggingKeyName = "Tagging";
inline constexpr std::string_view QVContentInfoKey = "ContentInfo";
inline constexpr std::string_view QVContentKeyValueDataKey = "KeyValueData";
inline constexpr std::string_view QVContentTaggingTypeKeyName = "Type";
inline constexpr std::string_view QVContentTaggingSubTypeKeyName = "SubType";
inline constexpr std::string_view QVContentTaggingDisplayKeyName = "DisplayName";
inline constexpr std::string_view QVContentTaggingUUIDKeyName = "UUID";
inline constexpr std::string_view QVContentTaggingRejectedKeyName = "Rejected";
/// @}

/// @{
/// Key of a record's key value.
inline constexpr std::string_view QVContentKeyLengthInSeconds = "LengthInSeconds";
inline constexpr std::string_view QVContentKeyBeatCount = "BeatCount";
inline constexpr std::string_view QVContentKeyTavioLoopType = "TavioLoopType";
inline constexpr std::string_view QVContentKeyMidiRootNote = "MidiRootNote";
inline constexpr std::string_view QVContentKeyKeyType = "KeyType";
inline constexpr std::string_view QVContentKeySignatureTop = "SignatureTop";
inline constexpr std::string_view QVContentKeySignatureBottom = "SignatureBottom";
/// @}

}  // namespace qvct
