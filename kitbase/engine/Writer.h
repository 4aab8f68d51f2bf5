// A buffered output writer for the formatters, help and schema output.
//
// Writer collects bytes in its own buffer and hands them on in large pieces: to a file
// descriptor (write(2), retried on EINTR), to a std::string the caller owns and keeps alive for
// the writer's lifetime, or nowhere (for measuring). The destructor flushes. A failed write(2)
// is remembered (ErrorCode) and everything after it is dropped; nothing throws.
#pragma once

#include <kitbase/Export.h>

#include <cstddef>
#include <cstring>
#include <memory>
#include <string>

namespace Kitbase {
namespace Engine {

class KITBASE_API Writer {
public:
    struct DiscardTag {};

    explicit Writer(int fd, std::size_t capacity = 1 << 16);
    explicit Writer(std::string* target, std::size_t capacity = 1 << 16);
    explicit Writer(DiscardTag, std::size_t capacity = 1 << 16);
    ~Writer();

    Writer(const Writer&) = delete;
    Writer& operator=(const Writer&) = delete;

    void Put(char c) {
        if (used_ == capacity_) Drain();
        buffer_[used_++] = c;
    }
    void Put(const char* data, std::size_t size) {
        if (size <= capacity_ - used_) {
            std::memcpy(buffer_.get() + used_, data, size);
            used_ += size;
        } else {
            PutLarge(data, size);
        }
    }
    void Put(const std::string& text) { Put(text.data(), text.size()); }
    void PutText(const char* text) { Put(text, std::strlen(text)); }
    void PutInt(long long value);
    void PutRepeat(char c, std::size_t count);

    // Hands everything buffered on; false once a write has failed.
    bool Flush();
    // errno of the first failed write, 0 when none failed.
    int ErrorCode() const { return error_; }

private:
    enum Sink { kFd, kString, kDiscard };
    void Drain();
    void PutLarge(const char* data, std::size_t size);

    Sink sink_;
    int fd_;
    std::string* target_;
    // Left uninitialised: only the used part is ever read, and zeroing 64 KiB costs a short
    // process more than its output does.
    std::unique_ptr<char[]> buffer_;
    std::size_t capacity_;
    std::size_t used_;
    int error_;
};

}  // namespace Engine
}  // namespace Kitbase
