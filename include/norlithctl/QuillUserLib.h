// The host's event library: posts entries to the host's observation log.
//
// A caller opens the library with QuillUserLib_Init, posts entries with QuillUserLib_AddQuill
// and closes it with QuillUserLib_Close. The functions never throw and own nothing the caller
// sees. Init and AddQuill return 0 on success and -1 on failure (the host cannot be opened, a
// fault is set on the call, AddQuill before Init or after Close, an entry the log refuses:
// empty, longer than 4096 bytes, or not UTF-8 text).
#pragma once

#include <norlithctl/Export.h>

#ifdef __cplusplus
extern "C" {
#endif

NORLITHCTL_API int QuillUserLib_Init(void);
// Formats like printf and posts the text as one entry. A format that starts with
// "@&!*@*@(ID)" posts an entry of event ID, formatted from the rest of the format; an id the log
// refuses (more than 255 bytes, or characters other than letters, digits, '.', '_' and '-')
// refuses the entry.
NORLITHCTL_API int QuillUserLib_AddQuill(const char* format, ...)
    __attribute__((format(printf, 1, 2)));
NORLITHCTL_API void QuillUserLib_Close(void);

#ifdef __cplusplus
}
#endif
