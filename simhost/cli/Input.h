// Reading a scenario for quarnhost: from a regular file or from standard input, never more than
// kMaxScenarioBytes. Anything else (a directory, a FIFO, a device such as /dev/zero) is refused
// before it is read, so that neither an endless source nor a blocking one can hold quarnhost.
// Failures throw InputError with a one-line message naming the source.
#pragma once

#include <cstddef>
#include <stdexcept>
#include <string>

namespace simhost {

// 256 MiB: several times a generated host of 100,000 rows, far below what a process may hold.
constexpr std::size_t kMaxScenarioBytes = std::size_t{256} << 20;

class InputError : public std::runtime_error {
public:
    explicit InputError(const std::string& message) : std::runtime_error(message) {}
};

// The whole text of source: a path, or "-" for standard input.
std::string ReadScenarioSource(const std::string& source, std::size_t limit = kMaxScenarioBytes);

// How messages name source: 'PATH', or standard input.
std::string SourceName(const std::string& source);

}  // namespace simhost
