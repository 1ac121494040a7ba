#pragma once

#include <string>
#include <string_view>
#include <vector>

namespace qvct::contentdb {

/// The form in which texts are compared: case folded, compatibility forms resolved, without diacritics.
/// Malformed bytes become U+FFFD.
std::string folded(std::string_view text);

/// The words of a text in folded form: its runs of letters and digits, in order.
std::vector<std::string> wordsOf(std::string_view text);

/// The first `characters` characters of a word; the whole word when it is shorter.
std::string_view wordPrefix(std::string_view word, std::size_t characters);

/// Folded letters and digits alone, so that "Sound Descriptors" and "sound-descriptors" are one name.
std::string bareName(std::string_view text);

}  // namespace qvct::contentdb
