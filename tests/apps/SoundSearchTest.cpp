#include "support/AudioFixtures.h"
#include "support/RunTool.h"
#include "support/TemporaryFolder.h"

#include <algorithm>
#include <cmath>
#include <random>
#include <set>
#include <vector>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::ElementsAre;
using testing::HasSubstr;

/// A struck sound, known at every instant, so that it can be sampled at any rate.
class Stroke {
  public:
    Stroke(unsigned seed, double pitch) {
        std::mt19937 random(seed);
        std::uniform_real_distribution<> share(0, 1);
        for (int i = 0; i < 24; ++i) {
            const double ratio = 1 + 12 * share(random) * share(random);
            partials_.push_back({pitch * ratio, 2 * M_PI * share(random), share(random) / ratio,
                                 3 + 6 * share(random) * ratio});
        }
    }

    double at(double seconds) const {
        double sum = 0;
        for (const auto& [pitch, phase, level, decay] : partials_)
            sum += level * std::exp(-decay * seconds) * std::sin(2 * M_PI * pitch * seconds + phase);
        return seconds < 0 ? 0 : 0.1 * sum;
    }

  private:
    struct Partial {
        double pitch, phase, level, decay;
    };
    std::vector<Partial> partials_;
};

/// How a sound is stored.
struct Form {
    double from = 0, seconds = 0.6;
    double gain = 1;
    unsigned rate = 44100, bits = 16;
};

std::string wavOf(const Stroke& stroke, const Form& form) {
    std::string bytes;
    const auto frames = static_cast<std::int64_t>(form.seconds * form.rate);
    for (std::int64_t i = 0; i < frames; ++i) {
        const double value = form.gain * stroke.at(form.from + static_cast<double>(i) / form.rate);
        const double most = std::exp2(form.bits - 1) - 1;
        const auto number = std::llround(std::clamp(value, -1.0, 1.0) * most);
        bytes += Wav().number(static_cast<std::uint64_t>(number), form.bits / 8);
    }
    return Wav().file(Wav().format(1, form.rate, form.bits) + Wav().chunk("data", bytes));
}

class SoundSearch : public testing::Test {
  protected:
    void write(const std::string& name, const Stroke& stroke, const Form& form = {}) const {
        folder_.write("sounds/" + name, wavOf(stroke, form));
    }
    void index() const {
        const ToolResult result = runTool({"index", folder_.path("sounds"), "--db", folder_.path("db")});
        EXPECT_EQ(result.status, 0) << result.errors;
    }
    ToolResult run(std::vector<std::string> words, const char* format = "--json") const {
        words.insert(words.end(), {"--db", folder_.path("db"), format});
        return runTool(words);
    }
    std::string sound(const std::string& name) const { return folder_.path("sounds/" + name); }

    TemporaryFolder folder_;
};

std::vector<std::string> names(const json& items) {
    std::vector<std::string> names;
    for (const json& item : items) {
        const std::string path = item["path"];
        names.push_back(path.substr(path.rfind('/') + 1));
    }
    return names;
}

TEST_F(SoundSearch, FindsDuplicatesUnderOtherNamesFormsLevelsAndCuts) {
    const Stroke one(1, 90), other(2, 90), third(3, 400);
    write("a.wav", one);
    write("b, louder.wav", one, {.gain = 1.9});
    write("c, 24 bits.wav", one, {.bits = 24});
    write("d, 48 kHz and quiet.wav", one, {.gain = 0.25, .rate = 48000});
    write("e, later and shorter.wav", one, {.from = -0.05, .seconds = 0.4});
    write("f.wav", one);  // as the first
    write("another stroke.wav", other);
    write("third.wav", third);
    write("third again.wav", third);
    index();
    const ToolResult result = run({"duplicates"});
    EXPECT_EQ(result.status, 0) << result.errors;
    const json groups = result.json();
    ASSERT_EQ(groups.size(), 2U) << groups.dump(1);
    EXPECT_EQ(groups[0]["kind"], "altered");
    EXPECT_EQ(groups[0]["best"], sound("d, 48 kHz and quiet.wav"));
    EXPECT_EQ(groups[0]["reasons"], json({"longer", "higher rate"}));
    EXPECT_THAT(names(groups[0]["copies"]),
                ElementsAre("d, 48 kHz and quiet.wav", "c, 24 bits.wav", "a.wav", "b, louder.wav", "f.wav",
                            "e, later and shorter.wav"));
    EXPECT_EQ(groups[0]["copies"][0]["sampleRate"], 48000);
    EXPECT_EQ(groups[0]["copies"][1]["bitDepth"], 24);
    EXPECT_EQ(groups[0]["copies"][5]["seconds"], 0.4);
    EXPECT_EQ(groups[0]["copies"][2]["exact"], false);
    EXPECT_EQ(groups[1]["kind"], "exact");
    EXPECT_EQ(groups[1]["reasons"], json::array());
    EXPECT_THAT(names(groups[1]["copies"]), ElementsAre("third again.wav", "third.wav"));
    // Among what a query finds.
    EXPECT_EQ(run({"duplicates", "bits:24"}).json(), json::array());
    EXPECT_THAT(names(run({"duplicates", "rate:44100 bits:16 -name:f"}).json()[0]["copies"]),
                ElementsAre("a.wav", "b, louder.wav", "e, later and shorter.wav"));
    EXPECT_THAT(run({"duplicates"}, "--quiet").output, HasSubstr("best     " + sound("third again.wav")));
    EXPECT_THAT(runTool({"duplicates", "--db", folder_.path("db")}).errors,
                HasSubstr("2 groups of the same sound, 8 items"));
    EXPECT_EQ(runTool({"duplicates", "--db", folder_.path("none")}).status, 1);
    EXPECT_EQ(run({"duplicates", "colour:red"}).status, 2);
}

TEST_F(SoundSearch, FindsWhatSoundsLikeAnItemOrAFile) {
    for (unsigned i = 0; i < 6; ++i) {
        write("low " + std::to_string(i) + ".wav", Stroke(i, 60 + i));
        write("high " + std::to_string(i) + ".wav", Stroke(i + 10, 1500 + 20 * i), {.seconds = 0.2});
    }
    index();
    const std::string heard = folder_.write("not there.wav", wavOf(Stroke(20, 62), {}));
    const auto areLow = [](const std::vector<std::string>& names) {
        return std::all_of(names.begin(), names.end(),
                           [](const auto& name) { return name.starts_with("low"); });
    };
    for (const std::string& path : {sound("low 0.wav"), heard}) {
        const ToolResult result = run({"similar", "--by", "sound", path, "--limit", "5"});
        ASSERT_EQ(result.status, 0) << result.errors;
        const auto found = names(result.json());
        EXPECT_EQ(found.size(), 5U);
        EXPECT_TRUE(areLow(found)) << testing::PrintToString(found);
        EXPECT_LE(std::count(found.begin(), found.end(), "low 0.wav"), path == heard);
        EXPECT_GE(result.json()[0]["similarity"], result.json()[4]["similarity"]);
        const std::string like = "like:\"" + path + "\"";
        EXPECT_TRUE(areLow(names(run({"search", like, "--limit", "6"}).json())));
        EXPECT_EQ(names(run({"search", like + " name:high"}).json()).size(), 6U);
    }
    EXPECT_EQ(names(run({"search", "like:\"" + sound("low 0.wav") + "\""}).json()).front(), "low 0.wav");
    const std::string silence = folder_.write(
        "silence.wav", Wav().file(Wav().format() + Wav().chunk("data", std::string(8000, '\0'))));
    for (const std::string& path : {silence, folder_.path("none.wav")}) {
        for (const auto& words : {std::vector<std::string>{"similar", "--by", "sound", path},
                                  {"search", "like:\"" + path + "\""}}) {
            const ToolResult result = run(words);
            EXPECT_EQ(result.status, 1) << words.back();
            EXPECT_THAT(result.errors, HasSubstr(path));
        }
    }
    EXPECT_EQ(run({"similar", "--by", "colour", heard}).status, 2);
    EXPECT_EQ(run({"similar", heard}).status, 1);  // by tags it must be an item
}

}  // namespace
}  // namespace qvct::test
