#pragma once

#include <string>
#include <string_view>
#include <vector>

/// What a patch holds, as the XML intermediate cache beside or inside it tells.
namespace qvct::demo {

struct Parameter {
    std::string_view name;
    double value;
    std::string_view valueString;
};

struct Plugin {
    std::string_view name;
    std::string_view settingName;
    std::vector<Parameter> parameters;
    bool bypassed = false;
};

struct Channel {
    std::string_view name;
    std::string_view type;  ///< "Instrument", "Audio", "Aux" or "Output"
    std::string_view mode;  ///< "Mono", "Stereo" or "Surround"
    std::vector<Plugin> plugins;
};

struct PatchDescription {
    std::string_view name;
    std::vector<Channel> channels;
};

/// The description as an indented UTF-8 document.
std::string xml(const PatchDescription& patch);

enum class Compression { none, zlib, gzip, zstandard };

/// Throws std::runtime_error where the library refuses.
std::string compressed(const std::string& text, Compression compression);

/// Writes the cache `base`.xml, or `base`.zxml where it is compressed.
void writeCache(const std::string& base, const PatchDescription& patch, Compression compression);

}  // namespace qvct::demo
