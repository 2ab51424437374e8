# Turns data/permutation_tables.bin (21 x 8192 little-endian int16) into a C++
# source file holding the tables as constant data, so nothing is read at run
# time. Run as: cmake -DIN=<bin> -DOUT=<cpp> -P embed_tables.cmake
file(READ "${IN}" hex HEX)
string(LENGTH "${hex}" hex_length)
if(NOT hex_length EQUAL 688128)
  message(FATAL_ERROR "${IN}: expected 344064 bytes, found ${hex_length} hex digits")
endif()
# Little-endian pairs of bytes become 0xHHLL; every entry is below 0x2000.
string(REGEX REPLACE "([0-9a-f][0-9a-f])([0-9a-f][0-9a-f])" "0x\\2\\1," entries "${hex}")
file(WRITE "${OUT}"
  "// Generated from data/permutation_tables.bin at build time; do not edit.\n"
  "#include \"engine/shuffle.h\"\n"
  "const int16_t PermutationTable[PermutationTableCount][BlockFrames] = {\n"
  "${entries}\n};\n")
