# Copies the header INPUT to OUTPUT with its includes of our other headers as hosts write them.
file(READ "${INPUT}" text)
string(REGEX REPLACE "#include \"([^\"]*/)?([^\"/]+)\"" "#include <qvcontenttagging/\\2>" text "${text}")
file(WRITE "${OUTPUT}" "${text}")
