#include "output/ItemTable.h"

#include "output/StandardStreams.h"
#include "platform/text/Text.h"
#include "platform/text/Url.h"

#include <algorithm>

namespace qvct::tool {

void printItemTable(const std::vector<ItemRow>& rows, const Terminal& terminal) {
    constexpr std::size_t widestName = 40;
    std::size_t width = 0;
    const auto nameOf = [](const ItemRow& row) {
        return printable(URL::fileURLWithPath(row.path).lastPathComponent());
    };
    for (const ItemRow& row : rows) width = std::max(width, displayWidth(nameOf(row)));
    width = std::min(width, widestName);
    std::string folder;
    for (const ItemRow& row : rows) {
        const std::string its = URL::fileURLWithPath(row.path).URLByDeletingLastPathComponent().path();
        if (its != folder)
            print("{}{}\n", folder.empty() ? "" : "\n", colored(terminal, Color::strong, printable(its)));
        folder = its;
        print("  {}  {}\n", padded(nameOf(row), width), wrapped(terminal, row.words, width + 4));
    }
}

}  // namespace qvct::tool
