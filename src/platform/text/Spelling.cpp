#include "platform/text/Spelling.h"

#include "platform/text/Text.h"

#include <algorithm>
#include <vector>

namespace qvct {
namespace {

// Nobody mistypes more than this.
constexpr std::size_t kLongestWord = 64;

std::size_t distanceOf(std::u16string_view a, std::u16string_view b) {
    // Three rows of the table of distances between the beginnings of both.
    std::vector<std::size_t> beforeLast(b.size() + 1), last(b.size() + 1), row(b.size() + 1);
    for (std::size_t j = 0; j <= b.size(); ++j) last[j] = j;
    for (std::size_t i = 1; i <= a.size(); ++i) {
        row[0] = i;
        for (std::size_t j = 1; j <= b.size(); ++j) {
            const std::size_t change = a[i - 1] == b[j - 1] ? 0 : 1;
            row[j] = std::min({last[j] + 1, row[j - 1] + 1, last[j - 1] + change});
            const bool areSwapped = i > 1 && j > 1 && a[i - 1] == b[j - 2] && a[i - 2] == b[j - 1];
            if (areSwapped) row[j] = std::min(row[j], beforeLast[j - 2] + 1);
        }
        std::swap(beforeLast, last);
        std::swap(last, row);
    }
    return last[b.size()];
}

}  // namespace

std::size_t spellingDistance(std::string_view a, std::string_view b) {
    return distanceOf(utf16FromUtf8(foldCase(a)), utf16FromUtf8(foldCase(b)));
}

std::string_view nearestSpelling(std::string_view word, std::span<const std::string> words) {
    if (word.size() > kLongestWord) return {};
    std::string_view nearest;
    std::size_t least = std::max<std::size_t>(1, utf16FromUtf8(word).size() / 3) + 1;
    for (const std::string& known : words) {
        if (known.size() > 2 * kLongestWord) continue;
        const std::size_t distance = spellingDistance(word, known);
        if (distance >= least) continue;
        least = distance;
        nearest = known;
    }
    return nearest;
}

}  // namespace qvct
