#include "demo/synthesis/Grooves.h"

#include <algorithm>
#include <stdexcept>
#include <string>

namespace qvct::demo {
namespace {

const std::vector<Groove>& grooves() {
    // clang-format off
    static const std::vector<Groove> all = {
        {"Four on the Floor", {
            {Drum::kick,      "X... x... x... x..."},
            {Drum::clap,      ".... X... .... X... .... X... .... X..o"},
            {Drum::closedHat, "o.x. o.x. o.x. o.xo", 0.3},
            {Drum::openHat,   "..x. ..x. ..x. ..x.", -0.3},
            {Drum::rim,       "...x ..x. ...x .... ...x ..x. .x.. x...", 0.5}}, 4, 54},
        {"House Topper", {
            {Drum::openHat,   "..x. ..x. ..x. ..x."},
            {Drum::shaker,    "xoxo xoxo xoxo xoxX"},
            {Drum::cowbell,   ".... ..x. .... x..."}}, 4, 56},
        {"Driving", {
            {Drum::kick,      "X... X... X... X..."},
            {Drum::closedHat, "oxox oxox oxox oxox"},
            {Drum::openHat,   "..X. ..X. ..X. ..X."},
            {Drum::rim,       "...x .... ..x. ...."},
            {Drum::clap,      ".... x... .... x..."}}},
        {"Boom Bap", {
            {Drum::kick,      "X..x .... ..x. .... X..x ...x ..x. .x.."},
            {Drum::snare,     ".... X... .... X..o .... X... .o.. X..."},
            {Drum::closedHat, "x.x. x.x. x.x. x.xo", 0.25}}, 4, 60},
        {"Swung Hats", {
            {Drum::closedHat, "Xoxo Xoxo Xoxo Xo.. Xoxo Xoxo Xooo x..."},
            {Drum::openHat,   ".... .... .... ..x. .... .... .... ..x."}}, 4, 62},
        {"Break", {
            {Drum::kick,      "X.x. .... ..xx .... X.x. .... ..x. ...x"},
            {Drum::snare,     ".... X..o .o.. X..o .... X..o .o.. ..X."},
            {Drum::ride,      "x.x. x.x. x.x. x.x."}}},
        {"One Drop", {
            {Drum::kick,      ".... .... X... ...."},
            {Drum::rim,       ".... .... X... .... .... .... X... ..x."},
            {Drum::closedHat, "x.xo x.xo x.xo x.x."}}, 4, 57},
        {"Hand Drums", {
            {Drum::bongo,     "X.ox x.o. X.ox o.xx", -0.4},
            {Drum::conga,     "..x. ..XX ..x. .X.. ..x. ..XX .x.. xX..", 0.4},
            {Drum::shaker,    "xoxo xoxo xoxo xoxo"}}, 4, 53},
        {"Tambourine", {
            {Drum::tambourine, "o.xo X.oo o.xo X.oo"}}, 4, 52},
        {"Tom Fill", {
            {Drum::kick,      "X... .... .... x..."},
            {Drum::snare,     "X.xx .... .... ...."},
            {Drum::highTom,   ".... X.xx ..x. ....", -0.4},
            {Drum::lowTom,    ".... .... X..x X.xX", 0.4}}},
        {"Waltz", {
            {Drum::ride,      "x... x..o x..."},
            {Drum::closedHat, ".... x... x..."},
            {Drum::kick,      "x... .... .... x... .... ..o."},
            {Drum::snare,     ".... ..o. ...."}}, 3, 60},
    };
    // clang-format on
    return all;
}

const std::vector<Phrase>& phrases() {
    static const std::vector<Phrase> all = {
        {"Offbeat Bass", "1.1- ..1. 1.3- ..5. 6.6- ..6. 7.7- ..5-"},
        {"Acid Line", "11.1 8.13 1.81 .573"},
        {"Slow Keys", "1--- ---. ..1- --.. 4--- ---. ..5- --..", true, 58},
        {"Arpeggio", "1358 5358 1358 5358 4681 8641 5792 9752"},
        {"Verse Melody", "1-.3 5-6- 5--- .3.2 1-.2 3-2- 1--- ...."},
        {"Mallet Pattern", "1.5. 8.5. 3.5. 8.5. 1.6. 8.6. 4.6. 8.6."},
    };
    return all;
}

template <typename Item>
const Item& named(const std::vector<Item>& items, std::string_view name) {
    const auto found =
        std::find_if(items.begin(), items.end(), [&](const Item& item) { return item.name == name; });
    if (found == items.end()) throw std::out_of_range("no groove or phrase \"" + std::string(name) + '"');
    return *found;
}

}  // namespace

const Groove& groove(std::string_view name) {
    return named(grooves(), name);
}
const Phrase& phrase(std::string_view name) {
    return named(phrases(), name);
}

}  // namespace qvct::demo
