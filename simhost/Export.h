// Visibility of the simulated host's API. The library is built with hidden visibility so that
// only what its users call is exported (fewer symbols to bind when a program starts); the
// exported classes, error types included, keep one identity across the libraries that share
// them.
#pragma once

#define SIMHOST_API __attribute__((visibility("default")))
