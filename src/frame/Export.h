// Exporting from the plug-in. libsystem.so is built with hidden visibility, so nothing leaves it
// unless marked: SYSTEM_EXPORT on a class exports the class (its members, virtual table and type
// information) and on a function exports the function. src/libsystem.exports lists everything
// exported, and a test holds the library's dynamic symbol table to that list.
#pragma once

#define SYSTEM_EXPORT __attribute__((visibility("default")))
