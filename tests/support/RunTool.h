#pragma once

#include "support/Places.h"
#include "support/TemporaryFolder.h"

#include <cstdio>
#include <string>
#include <vector>

#include <nlohmann/json.hpp>
#include <sys/wait.h>

namespace qvct::test {

struct ToolResult {
    int status = -1;
    std::string output;
    std::string errors;

    nlohmann::json json() const { return nlohmann::json::parse(output); }
};

inline std::string quoted(const std::string& text) {
    std::string result = "'";
    for (const char c : text) result += c == '\'' ? std::string("'\\''") : std::string(1, c);
    return result + "'";
}

/// Runs the tool as a user does, with its two streams apart. `before` stands in front of the command:
/// settings of the environment, or a program that starts it.
inline ToolResult runTool(const std::vector<std::string>& arguments, const std::string& before = {}) {
    const TemporaryFolder folder;
    std::string command = before + " " + quoted(QVCT_TOOL);
    for (const std::string& argument : arguments) command += " " + quoted(argument);
    command += " >" + quoted(folder.path("out")) + " 2>" + quoted(folder.path("err")) + " </dev/null";
    const int raw = std::system(command.c_str());
    return {WIFEXITED(raw) ? WEXITSTATUS(raw) : -1, readAll(folder.path("out")), readAll(folder.path("err"))};
}

}  // namespace qvct::test
