#include "demo/Library.h"

#include "demo/Patches.h"
#include "demo/files/AudioFiles.h"
#include "demo/files/Settings.h"

#include <filesystem>

namespace qvct::demo {
namespace {

constexpr std::string_view kCacheInBundle = "/org.qvcontenttagging.intermediate.cache";

struct SettingsItem {
    std::string_view path;
    PluginIdentity identity;
    std::endian order;
};

const std::vector<SettingsItem>& settings() {
    // clang-format off
    static const std::vector<SettingsItem> all = {
        {"Settings/Channel Strips/Voice/Warm Vocal Chain.cst", {"MELC", "chan", "aud1"}, std::endian::little},
        {"Settings/Channel Strips/Guitar/Electric Guitar Crunch.cst", {"MELC", "chan", "aud1", 2}, std::endian::big},
        {"Settings/Plug-Ins/Delay/Dub Echo Triplets.pst", {"MELC", "efx1", "tdly"}, std::endian::little},
    };
    // clang-format on
    return all;
}

/// Writes items below one folder and keeps their names.
class Writer {
  public:
    explicit Writer(std::string folder) : folder_(std::move(folder)) {}

    void audio() {
        for (const AudioItem& item : audioItems()) writeSound(add(item.path), sound(item));
    }

    void patchBundles() {
        for (const PatchItem& item : patches()) {
            writeCache(add(item.path) + std::string(kCacheInBundle), description(item), item.compression);
        }
        const SynthNote preview{Timbre::pad, 57, 0.5, Mode::minor};
        writeCaf(pathOf(patches().front().path) + "/prelisten.caf", render(preview, {.rate = 22050}));
    }

    void settingsFiles() {
        for (const SettingsItem& item : settings())
            writeFile(add(item.path), settingsBytes(item.identity, item.order));
        for (const PatchItem& item : settingsWithCaches()) {
            writeCache(pathOf(item.path), description(item), item.compression);
        }
    }

    void preset() {
        writeFile(add("Presets/Vorthal/Bass/Classic Bright Bass.vcp"),
                  presetText("Classic Bright Bass", "4001,5012,6004"));
    }

    /// What lies inside the bundle is part of the project, not content of its own.
    void project() {
        const std::string bundle = add("Projects/Midnight Drive Demo Song.ostrax");
        writeFile(bundle + "/Resources/tags.plist", projectRecord());
        writeWav(bundle + "/Media/Audio Files/Rim Take 1.wav", render(DrumHit{Drum::rim, Kit::house}, {}));
    }

    std::vector<std::string> items() && { return std::move(items_); }

  private:
    std::string pathOf(std::string_view item) const { return folder_ + "/" + std::string(item); }

    std::string add(std::string_view item) {
        items_.emplace_back(item);
        return pathOf(item);
    }

    static PatchDescription description(const PatchItem& item) {
        return {item.channels.front().name, item.channels};
    }

    std::string folder_;
    std::vector<std::string> items_;
};

}  // namespace

std::vector<std::string> writeLibrary(const std::string& folder) {
    Writer writer(folder);
    writer.audio();
    writer.patchBundles();
    writer.settingsFiles();
    writer.preset();
    writer.project();
    return std::move(writer).items();
}

}  // namespace qvct::demo
