#pragma once

#include "media/loopfile/RecordKeys.h"

#include <array>
#include <cstdint>
#include <string_view>

// Names, labels, codes and levels that files and hosts share.
namespace qvct {

/// @{
/// Key of the dictionary of one tagging.
inline constexpr std::string_view QVContentTaggingLabelKeyName = "Name";
inline constexpr std::string_view QVContentTaggingWeightKeyName = "Weight";
inline constexpr std::string_view QVContentTaggingAutoTaggingKeyName = "AutoTagging";
/// @}

/// @{
/// Key of a content info.
inline constexpr std::string_view QVContentInfoDependenciesKey = "Dependencies";
inline constexpr std::string_view QVContentInfoApplicationInfosKey = "ApplicationInfos";
inline constexpr std::string_view QVContentInfoAppIdentifierKey = "AppIdentifier";
inline constexpr std::string_view QVContentInfoMinimumVersionKey = "MinimumVersion";
inline constexpr std::string_view QVContentInfoLegacyKey = "Legacy";
/// @}

/// The property list inside a bundle that holds its metadata record.
inline constexpr std::string_view QVContentTaggingTagsPlistName = "tags.plist";
/// What the names of a bundle's intermediate cache files begin with.
inline constexpr std::string_view kProductPrefix = "org.qvcontenttagging";

/// @{
/// Identifier of a category of the default taxonomy.
inline constexpr std::string_view QVCategorySoundpackIdentifier = "Soundpack";
inline constexpr std::string_view QVCategoryContentTypeIdentifier = "Content Type";
inline constexpr std::string_view QVCategoryGenresIdentifier = "Genres";
inline constexpr std::string_view QVCategorySourceIdentifier = "Source";
inline constexpr std::string_view QVCategoryEffectsIdentifier = "Effects";
inline constexpr std::string_view QVCategoryPlugInsIdentifier = "PlugIns";
inline constexpr std::string_view QVCategoryLoopSpecificsIdentifier = "Loop Specifics";
/// @}

/// @{
/// Label of a tag of the default taxonomy.
inline constexpr std::string_view QVTagPatch = "Patch";
inline constexpr std::string_view QVTagAudioPatch = "Audio Patch";
inline constexpr std::string_view QVTagAuxPatch = "Aux Patch";
inline constexpr std::string_view QVTagOutputPatch = "Output Patch";
inline constexpr std::string_view QVTagInstrumentPatch = "Instrument Patch";
inline constexpr std::string_view QVTagTavioLoop = "Tavio Loop";
inline constexpr std::string_view QVTagVorthalSetting = "Vorthal Setting";
inline constexpr std::string_view QVTagSXV = "SXV";
inline constexpr std::string_view QVTagPST = "PST";
inline constexpr std::string_view QVTagCST = "CST";
inline constexpr std::string_view QVTagProject = "Project";
inline constexpr std::string_view QVTagDemoSong = "Demo Song";
inline constexpr std::string_view QVTagLiveLoopGrid = "Live Loop Grid";
inline constexpr std::string_view QVTagRemixSession = "Remix Session";
inline constexpr std::string_view QVTagTimeSignature = "Time Signature";
inline constexpr std::string_view QVTagKeyType = "Key Type";
inline constexpr std::string_view QVTagKey = "Key";
inline constexpr std::string_view QVTagAnyKeyType = "Any KeyType";
inline constexpr std::string_view QVTagMinorKeyType = "Minor KeyType";
inline constexpr std::string_view QVTagMajorKeyType = "Major KeyType";
inline constexpr std::string_view QVTagNeitherKeyType = "Neither KeyType";
inline constexpr std::string_view QVTagBothKeyType = "Both KeyType";
inline constexpr std::string_view QVTagCKey = "C";
inline constexpr std::string_view QVTagCSharpKey = "CSharp";
inline constexpr std::string_view QVTagDKey = "D";
inline constexpr std::string_view QVTagDSharpKey = "DSharp";
inline constexpr std::string_view QVTagEKey = "E";
inline constexpr std::string_view QVTagFKey = "F";
inline constexpr std::string_view QVTagFSharpKey = "FSharp";
inline constexpr std::string_view QVTagGKey = "G";
inline constexpr std::string_view QVTagGSharpKey = "GSharp";
inline constexpr std::string_view QVTagAKey = "A";
inline constexpr std::string_view QVTagASharpKey = "ASharp";
inline constexpr std::string_view QVTagBKey = "B";
/// @}
/// All keys from C upwards, by semitones.
inline constexpr std::array<std::string_view, 12> QVTagsOfKeys = {
    QVTagCKey,      QVTagCSharpKey, QVTagDKey,      QVTagDSharpKey, QVTagEKey,      QVTagFKey,
    QVTagFSharpKey, QVTagGKey,      QVTagGSharpKey, QVTagAKey,      QVTagASharpKey, QVTagBKey};

/// @{
/// One of the four levels of a person's rating, a weight in [0, 1].
inline constexpr float kTaggingLevel1 = 0.25F;
inline constexpr float kTaggingLevel2 = 0.5F;
inline constexpr float kTaggingLevel3 = 0.75F;
inline constexpr float kTaggingLevel4 = 1.0F;
/// @}

/// What kind of content a file is.
enum FileType : std::int64_t {
    kFileTypeNone = 0,
    kFileTypePatch = 1,
    kFileTypeLoop = 2,
    kFileTypeSynthPreset = 3,      ///< "vcp"
    kFileTypeSamplerSettings = 4,  ///< "sxv"
    kFileTypePlugInSettings = 5,   ///< "pst" and "aaz"
    kFileTypeChannelStrip = 6,     ///< "cst"
    kFileTypeAudioFile = 7,
    kFileTypeProject = 8
};

}  // namespace qvct
