#pragma once

#include <string_view>

namespace qvct {

/// Whether the text is exactly that of a script that is part of this library: such scripts need no guard.
bool isOwnScript(std::string_view script);

/// A JavaScript function that removes from the global object whatever could outlive or exceed a script's
/// limits. It is called before any foreign script runs, with a function `check(source, flags, text, start)`
/// that throws when a regular expression would take too long. It keeps its own references to whatever it
/// needs, so that nothing that scripts change later can affect it.
///
/// - Everything global that rules have no use for is gone, whatever later engines add: above all promises,
///   which are settled when the script has ended, memory without objects, and callbacks of the collector.
/// - Every operation that matches a regular expression goes through `check`. The engine looks up `exec` in
///   the expression at each match and uses its own where that is no function. So `exec` is made a property of
///   each expression that cannot be changed, and so is the constructor that makes copies.
/// - Operations that multiply a text are bounded.
std::string_view scriptGuard();

}  // namespace qvct
