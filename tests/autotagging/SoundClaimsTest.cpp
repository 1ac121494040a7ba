#include "autotagging/evidence/ClaimResolver.h"
#include "autotagging/evidence/SoundClaims.h"
#include "listening/HeardSound.h"
#include "taxonomy/TGRTTag.h"
#include "taxonomy/TGRTTaxonomy.h"

#include <gmock/gmock.h>

namespace qvct {
namespace {

using testing::ElementsAre;
using testing::IsEmpty;

/// "Kick", or "Bright / Dark 0.1" with a level, of what holds without the parents that it brings.
std::vector<std::string> heldOf(std::vector<TagClaim> claims, SoundKind kind) {
    static const ClaimResolver resolver(TGRTTaxonomy::defaultTaxonomy());
    std::vector<std::string> labels;
    for (const HeldTag& held : resolver.resolve(std::move(claims), kind).held) {
        if (held.claims.empty()) continue;
        labels.push_back(held.tag->label());
        if (held.level) labels.back() += " " + std::to_string(*held.level).substr(0, 3);
    }
    return labels;
}

HeardSound soundOf(std::vector<HeardSound::Instrument> instruments) {
    HeardSound sound;
    sound.instruments = std::move(instruments);
    return sound;
}

TEST(SoundClaims, SpeakForTheLikeliestInstrumentIfItIsLikely) {
    const struct {
        std::vector<HeardSound::Instrument> instruments;
        std::vector<std::string> held;
    } rows[] = {
        {{}, {}},
        {{{"Kick", 0.9}, {"Tom", 0.1}}, {"Kick"}},
        {{{"Kick", 0.7}, {"Tom", 0.69}}, {"Kick"}},
        {{{"Kick", 0.5}, {"Tom", 0.4}}, {}},
        {{{"No such tag", 0.9}}, {}},
    };
    for (const auto& [instruments, held] : rows)
        EXPECT_EQ(heldOf(claimsOfSound(soundOf(instruments)), SoundKind::oneShot), held);
}

TEST(SoundClaims, CountLessThanANameAndMoreTogetherWithIt) {
    TagClaim named;
    named.label = "Snare";
    named.service = "names";
    named.confidence = 0.9;
    std::vector<TagClaim> claims = claimsOfSound(soundOf({{"Kick", 0.95}}));
    claims.push_back(named);
    EXPECT_THAT(heldOf(claims, SoundKind::oneShot), ElementsAre("Snare"));
}

TEST(SoundClaims, TellTheKeyAndThePolesThatASoundIsNearTo) {
    HeardSound sound;
    sound.key = HeardSound::Key{10, true, 0.95};
    sound.traits = {{"Bright / Dark", 0.1, "sharpness, acum", 2.5},
                    {"Cold / Warm", 0.5, "warmth", 0.3},
                    {"Soft / Hard", 0.9, "hardness", 1},
                    {"Low / High", 1, "height, Hz", 9000}};
    EXPECT_THAT(heldOf(claimsOfSound(sound), SoundKind::loop),
                ElementsAre("Low / High 1.0", "Mono", "ASharp", "Minor KeyType", "Bright / Dark 0.1",
                            "Soft / Hard 0.9"));
    sound.traits.push_back({"Tonal / Non-Tonal", 0.14, "flatness, dB", -30});
    EXPECT_EQ(heldOf(claimsOfSound(sound), SoundKind::loop).size(), 6U) << "of four poles the nearest three";
    sound.key->isMinor = false;
    sound.key->tonic = 0;
    sound.traits.clear();
    EXPECT_THAT(heldOf(claimsOfSound(sound), SoundKind::loop), ElementsAre("C", "Major KeyType"));
    EXPECT_THAT(claimsOfSound(HeardSound{}), IsEmpty());
}

}  // namespace
}  // namespace qvct
