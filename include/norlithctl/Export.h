// Visibility of the host-control library's API.
//
// Every class the library shares with its callers carries default visibility, so that its type
// information is one across the program and the plug-ins it loads: a RavelException thrown inside
// the library must be caught by type inside a plug-in built with hidden visibility.
#pragma once

#define NORLITHCTL_API __attribute__((visibility("default")))
