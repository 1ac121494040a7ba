#pragma once

#include "platform/text/Text.h"

#include <string>
#include <string_view>

namespace qvct::test {

/// So many times `piece`, with its number where it says "#".
inline std::string repeated(int count, std::string_view piece) {
    const bool isNumbered = piece.find('#') != std::string_view::npos;
    std::string text;
    for (int i = 0; i < count; ++i) text += isNumbered ? replaceAll(piece, "#", std::to_string(i)) : piece;
    return text;
}

/// A document type whose entity "k" stands for ten to the fourteenth characters.
inline std::string entityBomb() {
    std::string bomb = "<!DOCTYPE l [<!ENTITY a 'aaaaaaaaaaaaaaaaaaaaaaaaaaaaaaaa'>";
    for (char c = 'b'; c < 'l'; ++c)
        bomb += std::string("<!ENTITY ") + c + " '" +
                repeated(16, std::string("&") + static_cast<char>(c - 1) + ";") + "'>";
    return bomb + "]>";
}

}  // namespace qvct::test
