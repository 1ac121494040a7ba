# Writes the bytes of INPUT as the array SYMBOL, with SYMBOL_len beside it, into the C++ source OUTPUT.
file(READ "${INPUT}" hex HEX)
string(LENGTH "${hex}" digits)
math(EXPR length "${digits} / 2")
string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
string(REGEX REPLACE "(................................................................................)" "\\1\n" bytes "${bytes}")
file(WRITE "${OUTPUT}" "#include \"resources/EmbeddedFiles.h\"\n
const unsigned char ${SYMBOL}[] = {\n${bytes}};
const std::uint32_t ${SYMBOL}_len = ${length};\n")
