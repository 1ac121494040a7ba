#pragma once

#include "ToolContext.h"

namespace CLI {
class App;
}

namespace qvct::tool {

/// `generate`, hidden: prints what the build needs of the command line.
void addGenerateCommand(CLI::App& app);

/// Each adds one command to the tool. A command reports what fails through the context and never throws.
void addAutotagCommand(CLI::App& app, ToolContext& context);
void addInspectCommand(CLI::App& app, ToolContext& context);
/// `db`: merges and checks databases.
void addDatabaseCommand(CLI::App& app, ToolContext& context);
void addIndexCommand(CLI::App& app, ToolContext& context);
void addKeywordsCommand(CLI::App& app, ToolContext& context);
void addObjectCommand(CLI::App& app, ToolContext& context);
void addRhythmCommand(CLI::App& app, ToolContext& context);
void addRulesCommand(CLI::App& app, ToolContext& context);
void addReadCommand(CLI::App& app, ToolContext& context);
/// `search`, `facets` and `similar`: what a database holds.
void addSearchCommands(CLI::App& app, ToolContext& context);
void addTaxonomyCommand(CLI::App& app, ToolContext& context);
void addWriteCommand(CLI::App& app, ToolContext& context);
/// Adds the commands below `taxonomy` that show what has become of retired vocabularies.
void addLegacyTaxonomyCommands(CLI::App& taxonomy, ToolContext& context);

}  // namespace qvct::tool
