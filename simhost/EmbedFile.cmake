# Turns a file into a C++ source defining simhost::kDefaultScenarioText (its bytes, NUL
# terminated) and simhost::kDefaultScenarioSize. Run as: cmake -DINPUT=... -DOUTPUT=... -P this.
file(READ "${INPUT}" content HEX)
string(LENGTH "${content}" hex_length)
math(EXPR size "${hex_length} / 2")
string(REGEX REPLACE "([0-9a-f][0-9a-f])" "0x\\1," bytes "${content}")
string(REGEX REPLACE "(0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,0x..,)" "\\1\n" bytes "${bytes}")
file(WRITE "${OUTPUT}.tmp"
  "// Generated from ${INPUT}; do not edit.\n#include <cstddef>\nnamespace simhost {\n"
  "extern const char kDefaultScenarioText[];\nextern const std::size_t kDefaultScenarioSize;\n"
  "const char kDefaultScenarioText[] = {\n${bytes}0x00};\n"
  "const std::size_t kDefaultScenarioSize = ${size};\n}  // namespace simhost\n")
file(COPY_FILE "${OUTPUT}.tmp" "${OUTPUT}" ONLY_IF_DIFFERENT)
file(REMOVE "${OUTPUT}.tmp")
