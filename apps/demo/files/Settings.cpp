#include "demo/files/Settings.h"

#include <fmt/format.h>

namespace qvct::demo {
namespace {

std::uint32_t fourCharacters(std::string_view code) {
    std::uint32_t value = 0;
    for (const char character : code) value = value << 8 | static_cast<unsigned char>(character);
    return value;
}

}  // namespace

std::string settingsBytes(const PluginIdentity& identity, std::endian order) {
    constexpr std::uint32_t kMagic = 0x51565354;
    constexpr std::uint16_t kVersion = 2;
    constexpr std::uint32_t kValues = 8;
    ByteWriter file(order);
    file.number(kMagic).number(kVersion);
    file.number(static_cast<std::uint8_t>(order == std::endian::little)).number(identity.subIdentifier);
    file.number(kValues);
    file.number(fourCharacters(identity.manufacturer));
    file.number(fourCharacters(identity.product));
    file.number(fourCharacters(identity.plugin));
    for (std::uint32_t i = 0; i < kValues; ++i) file.number(static_cast<float>(i) / kValues);
    return file.data();
}

std::string presetText(std::string_view name, std::string_view attributes) {
    return fmt::format(
        "<metadata>\nDisplayName = {}\nVersion = 1\n</metadata>\n"
        "<tagging>\nAttribs = {}\n</tagging>\n"
        "<applicationinfo>\nAppIdentifier = org.qvcontenttagging.demo\nMinimumVersion = "
        "1.0\n</applicationinfo>\n"
        "<assetdependencies>\n</assetdependencies>\n",
        name, attributes);
}

std::string projectRecord() {
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n"
           "<plist version=\"1.0\">\n<dict>\n"
           "\t<key>Type</key>\n\t<integer>8</integer>\n"
           "\t<key>SubType</key>\n\t<integer>1</integer>\n"
           "\t<key>Tagging</key>\n\t<dict>\n\t\t<key>Content Type</key>\n"
           "\t\t<array>\n\t\t\t<dict>\n\t\t\t\t<key>Name</key>\n\t\t\t\t<string>Demo Song</string>\n"
           "\t\t\t</dict>\n\t\t</array>\n\t</dict>\n"
           "</dict>\n</plist>\n";
}

}  // namespace qvct::demo
