#pragma once

#include <string_view>

namespace qvct {

/// Whether it is, letter by letter, a script that is part of this library: such scripts need no guard.
bool isOwnScript(std::string_view script);

/// A function in the scripts' language that takes from the global object what would outlive or outgrow a
/// script's limits. It is called before any foreign script runs, with a function `check(source, flags, text,
/// start)` that throws when a regular expression would take too long, and keeps for itself whatever it needs:
/// nothing that scripts change later has a part in it.
///
/// - Everything global that rules have no use for is gone, whatever later engines add: above all promises,
///   which are settled when the script has ended, memory without objects, and callbacks of the collector.
/// - Every operation that matches a regular expression goes through `check`. The engine looks up `exec` in
///   the expression at each match, and its own is used where that is no function: so it is made a property
///   of each expression that cannot be changed any more, as is the constructor that makes copies.
/// - Operations that multiply a text are bounded.
std::string_view scriptGuard();

}  // namespace qvct
