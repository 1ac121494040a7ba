#pragma once

#include "CommandDescription.h"
#include "formats/library/LinkRule.h"

#include <functional>
#include <memory>
#include <string>
#include <vector>

// The parser is a library of headers, which takes longer to compile than all that a command does. It is
// hidden behind these classes.
namespace CLI {
class App;
class Option;
}  // namespace CLI

namespace qvct::tool {

/// An option of a command, or a positional argument; copies stand for the same one.
class Option {
  public:
    explicit Option(CLI::Option& option) : option_(&option) {}

    Option& required();
    /// What stands for the value in texts. A PATH, FILE or DIR is not empty, as an unset variable would be:
    /// it would name the current folder and all that is in it.
    Option& valueName(const std::string& name);
    Option& oneOf(const std::vector<std::string>& words);
    Option& between(int least, int most);
    /// Refuses a NaN as well.
    Option& between(double least, double most);
    /// Whole numbers from 0, also hexadecimal ones (0x100); the parser alone takes -1 for the largest.
    Option& notNegative();
    /// Takes several values in one word.
    Option& separatedBy(char separator);
    /// Takes one word each time that it is given, so that arguments may follow it.
    Option& oneWordEach();
    Option& showsDefault();
    Option& needs(const Option& other);
    Option& excludes(const Option& other);

  private:
    CLI::Option* option_;
};

/// A command of the tool, or the tool itself; copies stand for the same one. Values that are bound to options
/// must live until the command has run.
class Command {
  public:
    explicit Command(CLI::App& parser) : parser_(&parser) {}

    Command addCommand(const std::string& name, const std::string& description);
    /// A name without dashes makes a positional argument. Values are texts, lists of them, and numbers; for
    /// the types see the definition.
    template <typename Value>
    Option addOption(const std::string& names, Value& value, const std::string& description);
    Option addFlag(const std::string& names, bool& value, const std::string& description);
    Option addFlag(const std::string& names, const std::function<void()>& action,
                   const std::string& description);
    /// "--follow", which makes a walk follow every link.
    Option addFollowFlag(LinksOutside& links);
    /// One of the commands below it must be named.
    void requireCommand();
    /// At most one of the commands below it may be named.
    void allowOneCommand();
    /// Whether a command below it was named, when it runs.
    bool isCommandNamed() const;
    /// The text below its help.
    void footer(const std::string& text);
    /// Leaves it out of help and descriptions.
    void hide();
    void callback(const std::function<void()>& run);

    /// Without hidden commands.
    CommandDescription describe() const;

  private:
    CLI::App* parser_;
};

/// The command line of a tool, which must name one command. Options of the tool may stand behind every
/// command.
class CommandLine {
  public:
    CommandLine(const std::string& name, const std::string& description, const std::string& version);
    ~CommandLine();

    Command tool();
    /// Calls `prepare` and runs the commands that are named, or prints what --help and --version ask for.
    /// False, and a line on standard error, when the words are wrong.
    bool run(int argc, char** argv, const std::function<void()>& prepare);

  private:
    std::unique_ptr<CLI::App> parser_;
};

}  // namespace qvct::tool
