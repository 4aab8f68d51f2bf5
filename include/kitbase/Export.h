// Visibility of the framework's API.
//
// Plug-ins are built with hidden visibility by default; every framework class they share with
// the framework carries default visibility so that its type information and virtual tables are
// one and the same across the program and every loaded plug-in (dynamic casts and exceptions
// depend on that).
#pragma once

#define KITBASE_API __attribute__((visibility("default")))
