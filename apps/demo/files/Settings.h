#pragma once

#include "demo/files/ByteWriter.h"

#include <string>
#include <string_view>

namespace qvct::demo {

/// Which plug-in a settings file belongs to: three four-character codes.
struct PluginIdentity {
    std::string_view manufacturer;
    std::string_view product;
    std::string_view plugin;
    std::uint8_t subIdentifier = 0;
};

/// The 24-byte header in either byte order, then the values of the settings.
std::string settingsBytes(const PluginIdentity& identity, std::endian order);

/// A synth preset: UTF-8 text in sections, with the attribute codes that older versions tagged it by.
std::string presetText(std::string_view name, std::string_view attributes);

/// The record of a project: its kind, and the tag that says so.
std::string projectRecord();

}  // namespace qvct::demo
