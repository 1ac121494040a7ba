#include "autotagging/scripts/ScriptEngine.h"

#include "platform/base/Log.h"
#include "platform/base/SharedLibrary.h"

namespace qvct {
namespace {

/// The engine, or why it is not there.
struct Loaded {
    ScriptEngine functions;
    Error error;
    bool isComplete = false;

    Loaded() {
        const auto library = SharedLibrary::load(QVCT_SCRIPT_ENGINE_LIBRARY, &error);
        if (library) isComplete = find(*library);
        if (!isComplete) log("Scripts do not run: " + error.message());
    }

    bool find(const SharedLibrary& library) {
        bool hasAll = true;
#define QVCT_SCRIPT_ENGINE_FIND(name) hasAll = hasAll && library.find(#name, functions.name, &error);
        QVCT_SCRIPT_ENGINE_FUNCTIONS(QVCT_SCRIPT_ENGINE_FIND)
#undef QVCT_SCRIPT_ENGINE_FIND
        return hasAll;
    }
};

const Loaded& loaded() {
    static const Loaded once;
    return once;
}

}  // namespace

bool ScriptEngine::load(Error* error) {
    if (!loaded().isComplete && error != nullptr) *error = loaded().error;
    return loaded().isComplete;
}

const ScriptEngine& engine() {
    return loaded().functions;
}

}  // namespace qvct
