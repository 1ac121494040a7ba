#include "CommandDescription.h"

namespace qvct::tool {
namespace {

void append(const CommandDescription& command, std::vector<const CommandDescription*>& all) {
    all.push_back(&command);
    for (const CommandDescription& below : command.commands) append(below, all);
}

}  // namespace

std::vector<const CommandDescription*> allCommands(const CommandDescription& root) {
    std::vector<const CommandDescription*> all;
    append(root, all);
    return all;
}

}  // namespace qvct::tool
