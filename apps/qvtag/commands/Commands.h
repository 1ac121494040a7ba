#pragma once

#include "ToolContext.h"

namespace qvct::tool {

class Command;

/// `generate`, hidden: prints what the build needs of the command line.
void addGenerateCommand(Command& tool);

/// Each adds one command to the tool. A command reports what fails through the context and never throws.
void addAutotagCommand(Command& tool, ToolContext& context);
void addExplainCommand(Command& tool, ToolContext& context);
void addEvaluateCommand(Command& tool, ToolContext& context);
void addInspectCommand(Command& tool, ToolContext& context);
/// `db`: merges and checks databases.
void addDatabaseCommand(Command& tool, ToolContext& context);
void addDuplicatesCommand(Command& tool, ToolContext& context);
void addIndexCommand(Command& tool, ToolContext& context);
void addKeywordsCommand(Command& tool, ToolContext& context);
void addLintCommand(Command& tool, ToolContext& context);
void addListenCommand(Command& tool, ToolContext& context);
void addObjectCommand(Command& tool, ToolContext& context);
void addRhythmCommand(Command& tool, ToolContext& context);
void addRulesCommand(Command& tool, ToolContext& context);
void addReadCommand(Command& tool, ToolContext& context);
/// `search`, `facets` and `similar`: what a database holds.
void addSearchCommands(Command& tool, ToolContext& context);
void addTaxonomyCommand(Command& tool, ToolContext& context);
void addWriteCommand(Command& tool, ToolContext& context);
/// Adds the commands below `taxonomy` that show what has become of retired vocabularies.
void addLegacyTaxonomyCommands(Command& taxonomy, ToolContext& context);

}  // namespace qvct::tool
