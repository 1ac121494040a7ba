#include "demo/Patches.h"

namespace qvct::demo {
namespace {

Plugin vorthal(std::string_view setting, double voices, double layered, double arpeggiated) {
    return {"Vorthal",
            setting,
            {{"Osc 1 Shape", 2, "Saw"},
             {"Filter Cutoff", 0.42, "640 Hz"},
             {"NmVoices", voices, voices < 1 ? "Mono" : "8"},
             {"IsLayered", layered, layered > 0 ? "On" : "Off"},
             {"IsArpeggiated", arpeggiated, arpeggiated > 0 ? "On" : "Off"},
             {"ArpMode", arpeggiated, arpeggiated > 0 ? "Up" : "Off"}}};
}

Plugin reverb() {
    return {"Hall Reverb", "Large Hall", {{"Time", 2.8, "2.8 s"}, {"Mix", 24, "24 %"}}};
}

Plugin equaliser(std::string_view setting) {
    return {"Channel EQ", setting, {{"High Shelf Gain", 3, "+3.0 dB"}, {"Low Cut", 1, "On"}}};
}

Plugin tapeDelay(double synchronised, std::string_view noteValue) {
    return {"Tape Delay",
            "Dub Echo",
            {{"Sync To Tempo", synchronised, synchronised > 0 ? "On" : "Off"},
             {"Note", 7, noteValue},
             {"Feedback", 35, "35 %"}}};
}

std::vector<PatchItem> instrumentPatches() {
    // clang-format off
    return {
        {"Patches/Instrument/Synthesizer/Warm Analog Synth.patch", Compression::none, {
            {"Warm Analog Synth", "Instrument", "Stereo", {vorthal("Warm Saws", 8, 1, 0), reverb()}}}},
        {"Patches/Instrument/Synthesizer/Mono Lead Digital.patch", Compression::zlib, {
            {"Mono Lead Digital", "Instrument", "Mono", {
                {"ZS M", "Solo Lead", {{"Voices", 1, "1"}, {"Glide", 0.2, "120 ms"}}},
                equaliser("Presence")}}}},
        {"Patches/Instrument/Synthesizer/Dream Pad Arpeggiator.patch", Compression::gzip, {
            {"Dream Pad Arpeggiator", "Instrument", "Stereo", {
                {"Arpeggiator", "Up and Down", {
                    {"Play/Stop", 1, "Play"}, {"Rate", 9, "1/8 triplet"}, {"Swing", 62, "62"}}},
                vorthal("Dream Bells", 0, 0, 1), reverb()}}}},
        {"Patches/Instrument/Keyboards/Vintage Electric Piano.patch", Compression::zstandard, {
            {"Vintage Electric Piano", "Instrument", "Stereo", {
                {"Tinewick", "Electric Suitcase", {{"Polyphony", 16, "16"}, {"Bell Volume", 0.6, "60 %"}}},
                {"Stereo Chorus", "Gentle", {{"Rate", 0.4, "0.40 Hz"}, {"Mix", 40, "40 %"}}}}}}},
        {"Patches/Instrument/Mallets/Wooden Marimba.patch", Compression::none, {
            {"Wooden Marimba", "Instrument", "Stereo", {
                {"Modelith", "Rosewood Bar", {{"Voices", 8, "8"}, {"Strike Position", 0.3, "30 %"}}}}}}},
        {"Patches/Instrument/Drum Kit/Swing Drum Machine.patch", Compression::gzip, {
            {"Swing Drum Machine", "Instrument", "Stereo", {
                {"Beatforge", "Shuffle Box", {
                    {"Swing Amnt Pat  1", 58, "58"}, {"Swing Amnt Pat  2", 50, "50"}, {"Polyphony", 0, "Mono"}}},
                {"Tape Saturation", "Crunchy", {{"Drive", 6, "6.0 dB"}, {"Mix", 70, "70 %"}}}}}}},
        {"Patches/Instrument/Orchestra/Strings and Horns.patch", Compression::zlib, {
            {"Violins", "Instrument", "Surround", {
                {"Stringarth", "Full Section", {{"Polyphony", 32, "32"}, {"Expression", 0.8, "80 %"}}}, reverb()}},
            {"Horns", "Instrument", "Surround", {
                {"Brassolith", "Four Horns", {{"Polyphony", 32, "32"}, {"Mute", 0, "Off"}}}}}}},
    };
    // clang-format on
}

std::vector<PatchItem> effectPatches() {
    // clang-format off
    return {
        {"Patches/Audio/Electric Guitar/Café Crunch Amp.patch", Compression::none, {
            {"Café Crunch Amp", "Audio", "Mono", {
                {"Amp", "Small Combo & Spring <bright>", {
                    {"Amp", 3, "Clean"}, {"Speaker", 5, "Vintage"}, {"Gain", 6.5, "6.5"}}},
                tapeDelay(1, "1/8 triplet")}}}},
        {"Patches/Audio/Bass/Smooth Electric Bass.patch", Compression::zstandard, {
            {"Smooth Electric Bass", "Audio", "Mono", {
                {"Bass Amp", "Studio Stack", {{"Amp", 1, "Clean"}, {"Speaker", 2, "Vintage"}}},
                {"Compressor", "Bass Squeeze", {{"Ratio", 4, "4:1"}, {"Attack", 12, "12 ms"}}}}}}},
        {"Patches/Audio/Voice/Bright Vocal Chain.patch", Compression::gzip, {
            {"Bright Vocal Chain", "Audio", "Stereo", {
                equaliser("Air"), tapeDelay(1, "1/4"),
                {"Arpeggiator", "Off", {{"Play/Stop", 1, "Play"}, {"Swing", 70, "70"}}, true}}}}},
        {"Patches/Aux/Large Dub Delay.patch", Compression::none, {
            {"Large Dub Delay", "Aux", "Stereo", {
                {"Echo", "Dub", {{"Time", 4, "1/4 triplet"}, {"Repeat", 45, "45 %"}}}, reverb()}}}},
    };
    // clang-format on
}

}  // namespace

const std::vector<PatchItem>& patches() {
    static const std::vector<PatchItem> all = [] {
        std::vector<PatchItem> items = instrumentPatches();
        const std::vector<PatchItem> effects = effectPatches();
        items.insert(items.end(), effects.begin(), effects.end());
        return items;
    }();
    return all;
}

const std::vector<PatchItem>& settingsWithCaches() {
    static const std::vector<PatchItem> all = {
        {"Settings/Channel Strips/Voice/Warm Vocal Chain.cst",
         Compression::zlib,
         {{"Warm Vocal Chain", "Audio", "Mono", {equaliser("Warmth"), tapeDelay(0, "1/4")}}}},
    };
    return all;
}

}  // namespace qvct::demo
