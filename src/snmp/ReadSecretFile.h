// ReadSecretFile: the secret held in a file named on the command line (the SNMP hash and test
// commands): its first line, white space trimmed at both ends.
//
// Only the first line is read, and at most kMaxSecretLine bytes of it; a pipe or FIFO is waited
// on for at most kSecretWaitSeconds, so no file makes the command hang. Throws
// Ravel::Lib::RavelException with "File name '<name>' could not be read, " and the system's text
// for the error when the file cannot be opened or read, has no line (an empty file: the text
// for error number 0), or its first line is longer than the bound (EFBIG). The secret itself never
// appears in a message.
#pragma once

#include <string>

namespace TarselCli {
namespace System {

constexpr std::size_t kMaxSecretLine = 4096;
constexpr int kSecretWaitSeconds = 3;

std::string ReadSecretFile(const std::string& name);

}  // namespace System
}  // namespace TarselCli
