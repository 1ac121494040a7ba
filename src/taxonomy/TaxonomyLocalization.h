#pragma once

#include "taxonomy/TGRTTaxonomy.h"

#include <string>

namespace qvct {

using Localization = TGRTTaxonomy::Localization;

/// What TGRTTaxonomy::localizationDictionary answers.
Localization localizationOf(const TGRTTaxonomy& taxonomy);

/// The strings as a table that translators edit: "key" = "value";
std::string stringsTableOf(const Localization& strings);

}  // namespace qvct
