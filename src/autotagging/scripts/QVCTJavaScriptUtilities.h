#pragma once

#include "autotagging/scripts/ScriptContext.h"

#include <memory>
#include <optional>
#include <string_view>

namespace qvct {

class QVCTXMLDocument;

/// Runs the scripts of tagging rules.
class QVCTJavaScriptUtilities {
  public:
    /// Runs the script in a context of its own, with the document as `document` and the library as
    /// `QVSearchKit.api`, and answers what its function `main` returns: an array of tag dictionaries.
    ///
    /// Nothing when `main` is missing, returns nothing or fails, or when a limit stopped the script; the log
    /// says why. Empty without a document. Safe from every thread, each with documents of its own.
    static std::optional<PropertyList::Array> tagsForXMLDocument(
        const std::shared_ptr<QVCTXMLDocument>& document, std::string_view javaScript);

    /// Evaluates the resource `<name>.js` of the resource folder, or the compiled-in library when there is no
    /// such file, whatever the name.
    static void includeJSResourceWithName(std::string_view name, ScriptContext& context);

    /// The limits of all further evaluations, in every thread.
    static ScriptLimits limits();
    static void setLimits(const ScriptLimits& limits);
};

}  // namespace qvct
