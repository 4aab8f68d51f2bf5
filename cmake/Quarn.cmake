# How the project's programs, libraries and plug-ins are linked.
#
# The libraries (quarnutil, kitbase, simhost, norlithctl, norlithuser) are static archives of
# position-independent code compiled with hidden visibility; what plug-ins call carries default
# visibility (KITBASE_API, NORLITHCTL_API). A program that loads plug-ins contains the framework
# and the host-control libraries whole and exports their API (quarn_plugin_host), so a plug-in
# links none of them: it resolves them, and the C++ runtime, from the program that loads it
# (quarn_add_plugin). quarncli also carries the C++ runtime inside (quarn_static_runtime): a
# short-lived process then binds no shared C++ runtime at start-up, which was most of its cost.

# Programs link the C++ runtime statically unless a sanitizer or the fuzzer runtime is in use
# (their allocators and interceptors expect the shared one).
if(QUARN_SANITIZE OR QUARN_FUZZ)
  set(QUARN_STATIC_RUNTIME_DEFAULT OFF)
else()
  set(QUARN_STATIC_RUNTIME_DEFAULT ON)
endif()
option(QUARN_STATIC_RUNTIME "Link quarncli with the C++ runtime inside, exported to its plug-ins"
  ${QUARN_STATIC_RUNTIME_DEFAULT})

# target loads plug-ins: it holds kitbase, norlithctl and norlithuser whole and exports every
# symbol of default visibility (SQLite's stay private).
function(quarn_plugin_host target)
  # The archives whole, by path, ahead of everything else on the link line (so the archives'
  # later appearances, as dependencies, find every member loaded already).
  target_link_libraries(${target} PRIVATE kitbase norlithctl norlithuser)
  # (One SHELL: group each, so that CMake's de-duplication of options leaves them whole.)
  target_link_options(${target} PRIVATE "SHELL:-Wl,--whole-archive $<TARGET_FILE:kitbase> \
$<TARGET_FILE:norlithctl> $<TARGET_FILE:norlithuser> -Wl,--no-whole-archive")
  set_target_properties(${target} PROPERTIES ENABLE_EXPORTS ON)
  target_link_options(${target} PRIVATE "LINKER:--exclude-libs,libsqlite3.a:libpugixml.a")
endfunction()

include(CheckLinkerFlag)
check_linker_flag(CXX "-Wl,-z,pack-relative-relocs" QUARN_LINKER_HAS_RELR)

# target carries the whole C++ runtime, exported, for itself and its plug-ins. Its relative
# relocations are packed (DT_RELR) where the tools support it: fewer to read at every start.
function(quarn_static_runtime target)
  if(QUARN_STATIC_RUNTIME)
    target_link_options(${target} PRIVATE -static-libstdc++
      "SHELL:-Wl,--whole-archive -l:libstdc++.a -Wl,--no-whole-archive")
  endif()
  if(QUARN_LINKER_HAS_RELR)
    target_link_options(${target} PRIVATE "LINKER:-z,pack-relative-relocs")
  endif()
endfunction()

# target's text starts with the code its commands run, listed by ORDER (a linker script
# fragment made by scripts/startup-order): a run then touches a few dense pages of the text
# instead of most of it, and the kernel maps (and counts as resident) the windows around each
# page touched. GNU ld has no option to order sections, so the linker's own default script for
# such a target (program or loadable module) is taken, with ORDER included at the head of its
# .text. GCC builds with function sections only; elsewhere, or when the linker does not show its
# script, the text keeps the link order.
function(quarn_startup_order target order)
  if(NOT QUARN_FUNCTION_SECTIONS)
    return()
  endif()
  get_target_property(type ${target} TYPE)
  set(probe ${CMAKE_BINARY_DIR}/CMakeFiles/${target}-ld-probe)
  file(WRITE ${probe}.cpp "int main() { return 0; }\n")
  # The script depends on the kind of output and on options such as -z now (hardening flags):
  # the probe links as the target does, with its flags.
  if(type STREQUAL "EXECUTABLE")
    set(kind)
    set(link_flags ${CMAKE_EXE_LINKER_FLAGS})
  else()
    set(kind -shared -fPIC)
    set(link_flags ${CMAKE_MODULE_LINKER_FLAGS})
  endif()
  if(QUARN_LINKER_HAS_RELR)
    list(APPEND kind -Wl,-z,pack-relative-relocs)
  endif()
  separate_arguments(flags UNIX_COMMAND "${CMAKE_CXX_FLAGS} ${link_flags}")
  execute_process(COMMAND ${CMAKE_CXX_COMPILER} ${flags} ${kind} -Wl,--verbose ${probe}.cpp
    -o ${probe} OUTPUT_VARIABLE out ERROR_QUIET RESULT_VARIABLE rc)
  set(rule "==================================================\n")
  string(FIND "${out}" "${rule}" begin)
  string(FIND "${out}" "\n${rule}" end REVERSE)
  set(head "  .text           :\n  {\n")
  string(FIND "${out}" "${head}" text)
  if(NOT rc EQUAL 0 OR begin EQUAL -1 OR end LESS_EQUAL begin OR text EQUAL -1)
    message(STATUS "The linker shows no default script: ${target}'s text keeps the link order")
    return()
  endif()
  string(LENGTH "${rule}" skip)
  math(EXPR begin "${begin} + ${skip}")
  math(EXPR length "${end} - ${begin} + 1")
  string(SUBSTRING "${out}" ${begin} ${length} script)
  string(REPLACE "${head}" "${head}    INCLUDE \"${order}\"\n" script "${script}")
  set(generated ${CMAKE_BINARY_DIR}/${target}.ld)
  file(WRITE ${generated}
    "/* The linker's default script, with ${target}'s startup order at the head of .text. */\n"
    "${script}")
  target_link_options(${target} PRIVATE "LINKER:-T,${generated}")
  set_property(TARGET ${target} APPEND PROPERTY LINK_DEPENDS ${generated} ${order})
endfunction()

# A loadable module of hidden visibility that compiles against the framework's and the
# host-control library's headers and links neither them nor the C++ runtime (the program that
# loads it provides them): the plug-ins, and the host-control library's own modules.
function(quarn_add_module target)
  add_library(${target} MODULE ${ARGN})
  target_include_directories(${target} PRIVATE ${PROJECT_SOURCE_DIR}/include)
  # No default libraries (the C++ runtime among them): only the C library and the unwinder.
  target_link_options(${target} PRIVATE -nodefaultlibs)
  target_link_libraries(${target} PRIVATE Boost::boost c gcc_s)
  # Packed relative relocations: fewer for the loader to read each time the module is loaded.
  if(QUARN_LINKER_HAS_RELR)
    target_link_options(${target} PRIVATE "LINKER:-z,pack-relative-relocs")
  endif()
  set_target_properties(${target} PROPERTIES
    PREFIX "lib"
    CXX_VISIBILITY_PRESET hidden
    VISIBILITY_INLINES_HIDDEN ON)
endfunction()

# A plug-in of quarncli.
function(quarn_add_plugin target)
  quarn_add_module(${target} ${ARGN})
endfunction()
