// A shared library in the plug-in directory that is not a plug-in: it lacks the entry point.
extern "C" __attribute__((visibility("default"))) int NotTheEntryPoint() { return 42; }
