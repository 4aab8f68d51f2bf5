# Turns the files below a directory into a C++ source defining simhost::files::kDefaultFiles, a
# table of {host path, bytes, size}, and kDefaultFileCount: the default host's files under root/.
# Run as: cmake -DINPUT=<directory> -DOUTPUT=<file.cpp> -P this.
file(GLOB_RECURSE paths LIST_DIRECTORIES false RELATIVE "${INPUT}" "${INPUT}/*")
list(SORT paths)
set(arrays "")
set(rows "")
set(index 0)
foreach(path ${paths})
  file(READ "${INPUT}/${path}" content HEX)
  string(LENGTH "${content}" hex_length)
  math(EXPR size "${hex_length} / 2")
  string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${content}")
  string(REGEX REPLACE "(0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,)" "\\1\n" bytes "${bytes}")
  string(APPEND arrays "const unsigned char kFile${index}[] = {\n${bytes}0x00};\n")
  string(APPEND rows "    {\"/${path}\", kFile${index}, ${size}},\n")
  math(EXPR index "${index} + 1")
endforeach()
if(index EQUAL 0)
  set(rows "    {nullptr, nullptr, 0},\n")
endif()
file(WRITE "${OUTPUT}.tmp"
  "// Generated from ${INPUT}; do not edit.\n#include <simhost/domains/Files.h>\n"
  "namespace simhost {\nnamespace files {\nnamespace {\n${arrays}}  // namespace\n"
  "const DefaultFile kDefaultFiles[] = {\n${rows}};\n"
  "const std::size_t kDefaultFileCount = ${index};\n}  // namespace files\n}  // namespace simhost\n")
file(COPY_FILE "${OUTPUT}.tmp" "${OUTPUT}" ONLY_IF_DIFFERENT)
file(REMOVE "${OUTPUT}.tmp")
