#include "contentdb/Query.h"

#include <gmock/gmock.h>

namespace qvct::test {
namespace {

using namespace contentdb;
using testing::HasSubstr;

const Vocabulary kVocabulary = {{"Genres", "GENRES", "Source", "Sound Effects", "Sound Descriptors"},
                                {"BeatCount", "Gain"}};

TEST(QueryParser, PointsAtWhatIsWrong) {
    struct Case {
        std::string query;
        std::size_t position;
        std::size_t length;
        std::string message;
    };
    const std::vector<Case> cases = {
        {"kick colour:red", 5, 6, "there is no field \"colour\""},
        {"sound:Warm", 0, 5, "more than one category: sound descriptors, sound effects"},
        {"kick bpm:140..90", 9, 7, "140 is more than 90"},
        {"bpm:fast", 4, 4, "\"fast\" is no number"},
        {"bpm:118..1x", 9, 2, "\"1x\" is no number"},
        {"note:H2", 5, 2, "\"H2\" is no number"},
        {"note:C12", 5, 3, "\"C12\" is no number"},
        {"bpm:A2", 4, 2, "\"A2\" is no number"},
        {"bpm:1e999", 4, 5, "is no number"},
        {"bpm:nan", 4, 3, "is no number"},
        {"bpm:..", 4, 2, "a number on one side"},
        {"bpm:", 0, 4, "a value is missing"},
        {"genre: House", 0, 6, "a value is missing"},
        {"genre>3", 5, 1, "cannot be compared"},
        {"type:banana", 5, 6, "types are other, patch, loop"},
        {"key:H", 4, 1, "is no key"},
        {"name::[", 6, 1, ""},
        {"kick \"deep", 5, 5, "not closed"},
        {"-bpm+", 0, 5, "cannot be negated"},
        {"kick colour-", 5, 7, "there is no field \"colour\""},
        {"kick like:", 5, 5, "a value is missing"},
        {"like>3", 0, 5, "takes the path of a sound"},
        {"like::a.wav", 0, 6, "takes the path of a sound"},
        {"-like:a.wav", 0, 11, "cannot be negated"},
        {"like:a.wav,b.wav", 0, 10, "one sound only"},
        {"like:a.wav like:b.wav", 11, 10, "one sound only"},
        {"\xff", 0, 1, "not UTF-8"},
    };
    for (const Case& one : cases) {
        QueryError error;
        EXPECT_FALSE(parseQuery(one.query, kVocabulary, &error)) << one.query;
        EXPECT_THAT(error.message, HasSubstr(one.message)) << one.query;
        EXPECT_EQ(error.position, one.position) << one.query;
        EXPECT_EQ(error.length, one.length) << one.query;
    }
}

IndexedItem item() {
    IndexedItem result;
    result.name = "Dusty Caf\xc3\xa9_Loop 120bpm";
    result.path = "/Music/Deep House/Dusty Loop.wav";
    result.fileType = 2;
    result.taggings = {{"Deep House", "Genres", {"House", "Electronic"}, {}, Provenance::stored, {}},
                       {"Warm", "Sound Descriptors", {}, 0.6F, Provenance::automatic, "keywords"},
                       {"Soft / Hard", "Sound Descriptors", {}, 0.1F, Provenance::automatic, "sound"},
                       {"ASharp", "Loop Specifics", {"Key"}, {}, Provenance::virtualTag, {}},
                       {"Minor KeyType", "Loop Specifics", {"Key Type"}, {}, Provenance::virtualTag, {}}};
    result.values = {{"Tempo", 120.0}, {"BeatCount", 16.0}, {"Gain", -6.0}, {"Note", 59.0}};
    result.packs = {"Dust & Grain"};
    for (int i = 0; i < 40; ++i) result.title += "\xef\xac\x83";  // "ffi" in one character
    result.title += " - Take";
    return result;
}

TEST(QueryParser, UnderstandsWhatPeopleWrite) {
    struct Case {
        std::string query;
        bool isFound;
    };
    const std::vector<Case> cases = {
        {"", true},
        {"dus loop", true},
        {"warm electronic", true},
        {"dus \"loo\"", false},
        {"CAFE", true},
        {"\"deep house\"", true},
        {"deep-hou", true},
        {"house-deep", false},
        {"-kick", true},
        {"-dusty", false},
        {"kick,dusty", true},
        {"kick, snare dusty", false},
        {"kick snare , dusty", true},
        {", ,", true},
        {"-", true},
        {"-\"deep techno\"", true},
        {"kick,", false},
        {"ffiffi take", true},
        {"soft", true},
        {"hard", false},
        {"tag:\"Soft / Hard\"", true},
        {"tag:house", true},
        {"tag:Hous", false},
        {"genre:electronic", true},
        {"Genres:House gen:House", true},
        {"source:House", false},
        {"genre:Techno,House", true},
        {"genre:Techno,bpm:120", true},
        {"-genre:Techno,Jazz", true},
        {"\"Sound Descriptors\":Warm sound-descriptor:warm", true},
        {"level:Warm>=0.6 level:Warm<=0.6", true},
        {"level:Warm>0.6", false},
        {"level:\"Warm\":0.5..0.7", true},
        {"level:Warm level:Dark,Warm>=0.6", true},
        {"level:\"Deep House\"", false},
        {"bpm:118..124 tempo:120 bpm=120 bpm>119.5 bpm:<121", true},
        {"bpm>120", false},
        {"bpm:121..", false},
        {"beats:16 gain:-6 gain<-5", true},
        {"note:B3 note:cb4 note:59 note:A#3..C4 note>Bb3", true},
        {"note:B4,Bb3,C-1", false},
        {"root:C3..", false},
        {"key:Bb key:A# key:A#m key:\"b flat minor\"", true},
        {"key:A#maj", false},
        {"type:Loop type:LOOP", true},
        {"type:patch", false},
        {"pack:\"dust & grain\"", true},
        {"path:\"deep house/dusty\"", true},
        {"path:techno", false},
        {"name::^dusty.*\\d+bpm$", true},
        {"name::\"caf\xc3\xa9\\W\"", false},
        {"genre::^(deep|tech)", true},
        {"bpm::^12.$ type::^loop$ pack::grain$ key::^asharp$ path::wav$", true},
        {"bpm+ name- dusty", true},
    };
    for (const Case& one : cases) {
        QueryError error;
        const auto query = parseQuery(one.query, kVocabulary, &error);
        ASSERT_TRUE(query) << one.query << ": " << error.message;
        EXPECT_EQ(matches(*query, item()), one.isFound) << one.query;
    }
}

}  // namespace
}  // namespace qvct::test
