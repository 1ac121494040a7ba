#include "autotagging/scripts/ScriptGuard.h"

#include "platform/data/PropertyList.h"
#include "resources/QVCTCompiledResources.h"

#include <string>
#include <unordered_set>

namespace qvct {
namespace {

std::unordered_set<std::string> ownScripts() {
    std::unordered_set<std::string> scripts;
    for (const auto& text : {QVCTCompiledResources::QVSearchKitJS(),
                             QVCTCompiledResources::ExtractSoftwareInstrumentsRuleJS()}) {
        if (text) scripts.insert(*text);
    }
    const auto rules = QVCTCompiledResources::DefaultRulesPlist();
    const PropertyList::Array* list = rules ? rules->array("DefaultRules") : nullptr;
    if (list == nullptr) return scripts;
    for (const PropertyList& rule : *list) {
        const auto* text = rule.dictionary() == nullptr ? nullptr : rule.dictionary()->string("rule");
        if (text != nullptr) scripts.insert(*text);
    }
    return scripts;
}

}  // namespace

bool isOwnScript(std::string_view script) {
    static const std::unordered_set<std::string> own = ownScripts();
    return own.contains(std::string(script));
}

std::string_view scriptGuard() {
    return R"js((function (check) {
    "use strict";
    const { apply } = Reflect, { defineProperty, getOwnPropertyDescriptor, getOwnPropertyNames } = Object;
    const RangeFault = RangeError, TypeFault = TypeError, nothing = [];
    const fixed = (value) => ({ __proto__: null, value, writable: false, enumerable: false, configurable: false });
    const replaced = (value) => ({ __proto__: null, value, writable: true, enumerable: false, configurable: true });

    const kept = new Set(["NaN", "undefined", "Infinity", "isNaN", "isFinite", "escape", "unescape", "decodeURI",
        "decodeURIComponent", "encodeURI", "encodeURIComponent", "eval", "globalThis", "parseInt", "parseFloat",
        "Error", "EvalError", "RangeError", "ReferenceError", "SyntaxError", "TypeError", "URIError",
        "AggregateError", "Proxy", "Reflect", "JSON", "Math", "Date", "Boolean", "Map", "Number", "Set", "WeakMap",
        "WeakSet", "Object", "Function", "Array", "RegExp", "Iterator", "String", "BigInt", "Symbol", "Intl",
        "console", "__log", "document", "QVSearchKit"]);
    for (const name of getOwnPropertyNames(globalThis)) {
        if (!kept.has(name)) delete globalThis[name];
    }
    delete Array.fromAsync;

    const expressions = RegExp.prototype, { exec } = expressions;
    const getter = (name) => getOwnPropertyDescriptor(expressions, name)?.get;
    const source = getter("source");
    const letters = ["i", "m", "s", "v"];
    const flags = [getter("ignoreCase"), getter("multiline"), getter("dotAll"), getter("unicodeSets")];
    const isGlobal = getter("global"), isSticky = getter("sticky");
    const guarded = fixed(function (text) {
        const pattern = apply(source, this, nothing);
        let set = "";
        for (let i = 0; i < 4; ++i) if (flags[i] && apply(flags[i], this, nothing)) set += letters[i];
        text = `${text}`;
        const start = this.lastIndex;
        if (typeof start !== "number") throw new TypeFault("lastIndex is not a number");
        const isPlaced = apply(isGlobal, this, nothing) || apply(isSticky, this, nothing);
        check(pattern, set, text, isPlaced ? start : 0);
        return apply(exec, this, [text]);
    });
    const withoutConstructor = fixed(undefined);
    defineProperty(expressions, "exec", guarded);
    for (const name of ["test", Symbol.match, Symbol.matchAll, Symbol.replace, Symbol.search, Symbol.split]) {
        const original = expressions[name];
        defineProperty(expressions, name, replaced(function () {
            defineProperty(this, "exec", guarded);
            defineProperty(this, "constructor", withoutConstructor);
            return apply(original, this, arguments);
        }));
    }

    const longest = 16777216;
    const texts = String.prototype;
    const bound = (name, length, most = longest) => {
        const original = texts[name];
        defineProperty(texts, name, replaced(function (argument, other) {
            if (this === undefined || this === null) throw new TypeFault("not a text");
            const text = `${this}`;
            if (name !== "normalize") argument = +argument;
            if (length(text.length, argument) > most) throw new RangeFault("the text would be too long");
            return apply(original, text, [argument, other]);
        }));
    };
    bound("repeat", (length, count) => length * count);
    bound("padStart", (length, wanted) => wanted);
    bound("padEnd", (length, wanted) => wanted);
    bound("normalize", (length) => length, 1048576);
}))js";
}

}  // namespace qvct
