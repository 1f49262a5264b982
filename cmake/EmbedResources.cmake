# cmake -DINPUT=Hivelet.res -DOUTPUT=resources.cpp -P EmbedResources.cmake
# Embeds a compiled resource file in a Linux library, where the portable Win32 layer finds it
# as the library's resource section.
file(READ ${INPUT} hex HEX)
string(LENGTH "${hex}" hexLength)
math(EXPR size "${hexLength} / 2")
string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${hex}")
string(REGEX REPLACE "((0x..,){16})" "\\1\n" bytes "${bytes}")
file(WRITE ${OUTPUT} "// Generated from ${INPUT}; do not edit.\n#include <stddef.h>\n"
  "extern \"C\" __attribute__((visibility(\"default\"), aligned(4))) const unsigned char W32ResourceSection[] = {\n${bytes}};\n"
  "extern \"C\" __attribute__((visibility(\"default\"))) const size_t W32ResourceSectionSize = ${size};\n")
