#pragma once

#include "output/Output.h"

#include <string>
#include <vector>

namespace qvct {

struct HeardSound;

namespace tool {

/// "A#2"; C4 is 60.
std::string nameOfNote(int number);
/// "A# minor"
std::string nameOfKey(int tonic, bool isMinor);

/// {"path","instruments":[{"label","confidence"}],"character":{"Bright /
/// Dark":0.62,...},"note","cents","key","mode", "tempo","loop",...,"confidences":{...}}, null where there is
/// nothing to say.
Json jsonOfSound(const std::string& path, const HeardSound& sound);
/// What there is to say besides the instrument, in lines.
std::vector<std::string> linesOfSound(const HeardSound& sound);
/// All of it as lines that can be read at a glance.
std::string textOfSound(const std::string& path, const HeardSound& sound, const Terminal& terminal);

}  // namespace tool
}  // namespace qvct
