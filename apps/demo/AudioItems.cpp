#include "demo/Library.h"

#include <filesystem>

namespace qvct::demo {
namespace {

constexpr AudioFormat kMono{};
constexpr AudioFormat kStereo{.channels = 2};
constexpr AudioFormat kFineMono{.rate = 48000, .bits = 24};
constexpr AudioFormat kFineStereo{.rate = 48000, .channels = 2, .bits = 24};
constexpr AudioFormat kSmall{.rate = 22050};
constexpr AudioFormat kSmallStereo{.rate = 22050, .channels = 2};

std::vector<AudioItem> loops() {
    // clang-format off
    return {
        {"Loops/House/Deep House Beat 122bpm.caf", DrumLoop{"Four on the Floor", Kit::house, 122, 2}, kStereo},
        {"Loops/House/Deep House Bass line A Minor 122bpm.wav",
            SynthLoop{Timbre::analogBass, "Offbeat Bass", 33, Mode::minor, 122, 2}, kMono},
        {"Loops/House/Bright House Topper 124bpm.aiff", DrumLoop{"House Topper", Kit::house, 124, 1}, kMono},
        {"Loops/Techno/Distorted Techno Beat 132bpm.wav", DrumLoop{"Driving", Kit::techno, 132, 1}, kStereo},
        {"Loops/Techno/Acid Synth Bass F Minor 132bpm.caf",
            SynthLoop{Timbre::acidBass, "Acid Line", 29, Mode::minor, 132, 1}, kFineMono},
        {"Loops/Hip Hop/Lo-Fi Hi-Hats 90bpm Swing.aiff", DrumLoop{"Swung Hats", Kit::loFi, 90, 2}, kSmall},
        {"Loops/Hip Hop/Boom Bap Drum Machine 90bpm.wav", DrumLoop{"Boom Bap", Kit::boomBap, 90, 2}, kMono},
        {"Loops/Hip Hop/Mellow Electric Piano D Minor 86.5bpm.aiff",
            SynthLoop{Timbre::electricPiano, "Slow Keys", 50, Mode::minor, 86.5, 2}, kSmall},
        {"Loops/Drum'n'Bass/Jungle Drum Break 174bpm.wav", DrumLoop{"Break", Kit::acoustic, 174, 2}, kFineMono},
        {"Loops/Reggae & Ska/Reggae One Drop Drums 76bpm.caf", DrumLoop{"One Drop", Kit::acoustic, 76, 2}, kSmall},
        {"Loops/Pop/80s Synths Arp C Major 118bpm.wav",
            SynthLoop{Timbre::pluck, "Arpeggio", 60, Mode::major, 118, 2}, kStereo},
        {"Loops/Latin/Bongos and Congas 105bpm.aiff", DrumLoop{"Hand Drums", Kit::acoustic, 105, 2}, kSmallStereo},
        {"Loops/Rock/Hard Rock Drum Fill 140bpm.aif", DrumLoop{"Tom Fill", Kit::acoustic, 140, 1}, kStereo},
        {"Loops/Jazz/Jazz Waltz Ride 3-4 150bpm.caf", DrumLoop{"Waltz", Kit::acoustic, 150, 2}, kMono},
        {"Loops/Percussion/Tambourines 120bpm.wav", DrumLoop{"Tambourine", Kit::house, 120, 1}, kMono},
        {"Loops/African/Marimba Mallet Pattern G Major 112bpm.caf",
            SynthLoop{Timbre::marimba, "Mallet Pattern", 55, Mode::major, 112, 2}, kMono},
        {"Loops/Asian/琴の旋律 Koto Melody D Minor 80bpm.wav",
            SynthLoop{Timbre::koto, "Verse Melody", 62, Mode::minor, 80, 2}, kSmall},
    };
    // clang-format on
}

std::vector<AudioItem> oneShots() {
    // clang-format off
    return {
        {"One Shots/Drums/Kick/Deep House Kick.wav", DrumHit{Drum::kick, Kit::house}, kMono},
        {"One Shots/Drums/Kick/Distorted Techno Kick.aiff", DrumHit{Drum::kick, Kit::techno}, kFineMono},
        {"One Shots/Drums/Snare/Tight Acoustic Snare.wav", DrumHit{Drum::snare, Kit::acoustic}, kFineMono},
        {"One Shots/Drums/Snare/Lo-Fi Snare.caf", DrumHit{Drum::snare, Kit::loFi}, kSmall},
        {"One Shots/Drums/Hi-Hat/Closed Hi-Hat.wav", DrumHit{Drum::closedHat, Kit::house}, kMono},
        {"One Shots/Drums/Hi-Hat/Open Hi-Hat Bright.aif", DrumHit{Drum::openHat, Kit::house}, kMono},
        {"One Shots/Drums/Toms/Low Tom.caf", DrumHit{Drum::lowTom, Kit::acoustic}, kMono},
        {"One Shots/Drums/Cymbal/Crash Reversed.wav", DrumHit{Drum::crash, Kit::acoustic, true}, kStereo},
        {"One Shots/Percussion/Analog Clap.wav", DrumHit{Drum::clap, Kit::house}, kMono},
        {"One Shots/Percussion/Cencerro Español Cowbell.aiff", DrumHit{Drum::cowbell, Kit::house}, kMono},
        {"One Shots/Bass/Sub Bass C.wav", SynthNote{Timbre::subBass, 36, 0.8}, kMono},
        {"One Shots/Synth/Warm Pad C Minor.wav", SynthNote{Timbre::pad, 48, 1.5, Mode::minor}, kFineStereo},
        {"One Shots/Synth/Digital Lead G.aiff", SynthNote{Timbre::lead, 67, 0.5}, kMono},
        {"One Shots/Keyboards/Vintage Clav E.caf", SynthNote{Timbre::clavinet, 52, 0.6}, kMono},
        {"One Shots/Mallets/Bell/Glassy Cold Bell A.wav", SynthNote{Timbre::bell, 81, 1}, kMono},
        {"One Shots/Vocals/Vox Ah D.aiff", SynthNote{Timbre::voice, 50, 1}, kFineMono},
        {"One Shots/Sound Effects/Noise Riser 4 Beats 128bpm.wav", Riser{128, 4}, kStereo},
    };
    // clang-format on
}

}  // namespace

const std::vector<AudioItem>& audioItems() {
    static const std::vector<AudioItem> all = [] {
        std::vector<AudioItem> items = loops();
        const std::vector<AudioItem> hits = oneShots();
        items.insert(items.end(), hits.begin(), hits.end());
        return items;
    }();
    return all;
}

Sound sound(const AudioItem& item) {
    Sound result = render(item.recipe, item.format);
    result.name = std::filesystem::path(item.path).stem().string();
    return result;
}

}  // namespace qvct::demo
