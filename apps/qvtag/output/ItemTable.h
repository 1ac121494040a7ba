#pragma once

#include "output/Output.h"

#include <string>
#include <vector>

namespace qvct::tool {

/// What a table says of an item: where it lies, its name, and words about it.
struct ItemRow {
    std::string path;
    std::vector<Word> words;
};

/// Prints a heading for each folder, and below it a line for each item in it.
void printItemTable(const std::vector<ItemRow>& rows, const Terminal& terminal);

}  // namespace qvct::tool
