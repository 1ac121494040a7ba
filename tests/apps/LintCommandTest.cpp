#include "support/AudioFixtures.h"
#include "support/RunTool.h"

#include <filesystem>

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using nlohmann::json;
using testing::HasSubstr;

/// Two silent files; of one the chunk and the name state different tempos.
class Lint : public testing::Test {
  protected:
    std::string write(const std::string& name, float tempoOfChunk) const {
        const Wav wav;
        return folder.write("Loops/" + name,
                            wav.file(wav.format() + wav.chunk("data", std::string(4000, '\0')) +
                                     wav.acid(0, 60, 0, tempoOfChunk)));
    }

    TemporaryFolder folder;
    const std::string right = write("Beat 120bpm.wav", 120);
    const std::string wrong = write("Beat 124bpm.wav", 97);
};

TEST_F(Lint, ShowsOnlyItemsThatContradictThemselves) {
    const auto run = runTool({"--json", "lint", folder.path("Loops")});
    EXPECT_EQ(run.status, 0);
    const json items = run.json();
    ASSERT_EQ(items.size(), 1U) << items;
    EXPECT_EQ(items[0]["path"], wrong);
    EXPECT_EQ(items[0]["contradictions"], json::parse(R"([{"subject": "tempo",
        "stated": {"value": "97 bpm", "source": "file", "confidence": 1.0},
        "against": {"value": "124 bpm", "source": "name", "confidence": 1.0}}])"));
    const auto table = runTool({"lint", right, wrong});
    EXPECT_THAT(table.output, HasSubstr("97 bpm by its file  124 bpm by its name"));
    EXPECT_THAT(table.errors, HasSubstr("1 of 2 items"));
}

TEST_F(Lint, LooksAtItemsThatAQueryFinds) {
    const std::string database = folder.path("loops.db");
    ASSERT_EQ(runTool({"index", folder.path("Loops"), "--db", database}).status, 0);
    EXPECT_EQ(runTool({"--json", "lint", "--db", database, "--query", "tempo:97"}).json().size(), 1U);
    EXPECT_EQ(runTool({"--json", "lint", "--db", database, "--query", "tempo:120"}).json().size(), 0U);
    EXPECT_EQ(runTool({"lint"}).status, 2);
}

/// What a person put into the record outranks names.
TEST_F(Lint, BelievesAPerson) {
    ASSERT_EQ(runTool({"write", "--add", "Loop Specifics/F", right}).status, 0);
    const std::string named = folder.path("Loops/Beat 120bpm.wav");
    const std::string inC = folder.path("Loops/Synth C#m 120bpm.wav");
    std::filesystem::rename(named, inC);
    const json items = runTool({"--json", "lint", inC}).json();
    ASSERT_EQ(items.size(), 1U);
    EXPECT_EQ(items[0]["contradictions"][0]["subject"], "key");
    EXPECT_EQ(items[0]["contradictions"][0]["stated"]["value"], "F");
    EXPECT_EQ(items[0]["contradictions"][0]["against"]["value"], "C# minor");
}

}  // namespace
}  // namespace qvct::test
