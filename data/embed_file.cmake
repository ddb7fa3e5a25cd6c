# Turns a binary file into a C++ source that defines a byte array and its size.
#   cmake -DINPUT=<file> -DOUTPUT=<file.cpp> -DSYMBOL=<name> -P embed_file.cmake
file(READ "${INPUT}" hex HEX)
string(LENGTH "${hex}" hex_length)
math(EXPR size "${hex_length} / 2")
# Sixteen bytes to a line keeps the generated source readable and the compiler quick.
string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
string(REGEX REPLACE "((0x..,){16})" "\\1\n" bytes "${bytes}")
file(WRITE "${OUTPUT}.tmp"
     "// Generated from ${INPUT} by embed_file.cmake; do not edit.\n"
     "#include <cstddef>\n#include <cstdint>\n\n"
     "namespace quillane::embedded {\n"
     "extern const std::uint8_t ${SYMBOL}[];\n"
     "extern const std::size_t ${SYMBOL}_size;\n"
     "alignas(4) const std::uint8_t ${SYMBOL}[] = {\n${bytes}};\n"
     "const std::size_t ${SYMBOL}_size = ${size};\n"
     "}  // namespace quillane::embedded\n")
file(RENAME "${OUTPUT}.tmp" "${OUTPUT}")
