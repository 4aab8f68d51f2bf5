// Fuzzes the reader of secret files (the SNMP hash and test commands) with arbitrary file
// contents: the secret is the first line, trimmed, never longer than the bound; a file it
// refuses gives the one message form, which never holds the secret.
#include "snmp/ReadSecretFile.h"

#include <norlithctl/RavelException.h>

#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstdlib>
#include <string>
#include <unistd.h>

namespace {

bool IsBlank(char c) { return c == ' ' || c == '\t' || c == '\r' || c == '\v' || c == '\f'; }

std::string Path() {
    static std::string path = [] {
        char name[] = "/tmp/fuzz_secret_XXXXXX";
        int fd = mkstemp(name);
        if (fd < 0) std::abort();
        close(fd);
        return std::string(name);
    }();
    return path;
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* data, std::size_t size) {
    const std::string content(reinterpret_cast<const char*>(data), size);
    FILE* file = std::fopen(Path().c_str(), "wb");
    if (!file || std::fwrite(content.data(), 1, content.size(), file) != content.size()) std::abort();
    std::fclose(file);
    try {
        const std::string secret = TarselCli::System::ReadSecretFile(Path());
        if (secret.find('\n') != std::string::npos) std::abort();
        if (secret.size() > TarselCli::System::kMaxSecretLine) std::abort();
        if (!secret.empty() && (IsBlank(secret.front()) || IsBlank(secret.back()))) std::abort();
        // The secret is what the first line holds.
        if (content.find(secret) == std::string::npos) std::abort();
        if (content.find(secret) > content.find('\n')) std::abort();
    } catch (const Ravel::Lib::RavelException& e) {
        const std::string message = e.GetMessage(0);
        if (message.compare(0, 11, "File name '") != 0) std::abort();
        const std::string line = content.substr(0, content.find('\n'));
        if (line.size() > 8 && message.find(line) != std::string::npos) std::abort();
    }
    return 0;
}
