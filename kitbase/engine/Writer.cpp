// Buffered writer: buffer handling and the three sinks.
#include "engine/Writer.h"

#include <cerrno>
#include <charconv>
#include <unistd.h>

namespace Kitbase {
namespace Engine {

Writer::Writer(int fd, std::size_t capacity)
    : sink_(kFd), fd_(fd), target_(nullptr),
      buffer_(new char[capacity ? capacity : 1]), capacity_(capacity ? capacity : 1), used_(0),
      error_(0) {}

Writer::Writer(std::string* target, std::size_t capacity)
    : sink_(kString), fd_(-1), target_(target),
      buffer_(new char[capacity ? capacity : 1]), capacity_(capacity ? capacity : 1), used_(0),
      error_(0) {}

Writer::Writer(DiscardTag, std::size_t capacity)
    : sink_(kDiscard), fd_(-1), target_(nullptr),
      buffer_(new char[capacity ? capacity : 1]), capacity_(capacity ? capacity : 1), used_(0),
      error_(0) {}

Writer::~Writer() { Drain(); }

void Writer::Drain() {
    if (used_ == 0) return;
    if (sink_ == kString) {
        target_->append(buffer_.get(), used_);
    } else if (sink_ == kFd && error_ == 0) {
        const char* data = buffer_.get();
        std::size_t left = used_;
        while (left > 0) {
            ssize_t written = ::write(fd_, data, left);
            if (written < 0) {
                if (errno == EINTR) continue;
                error_ = errno;
                break;
            }
            data += written;
            left -= static_cast<std::size_t>(written);
        }
    }
    used_ = 0;
}

void Writer::PutLarge(const char* data, std::size_t size) {
    while (size > 0) {
        if (used_ == capacity_) Drain();
        std::size_t room = capacity_ - used_;
        std::size_t chunk = size < room ? size : room;
        std::memcpy(buffer_.get() + used_, data, chunk);
        used_ += chunk;
        data += chunk;
        size -= chunk;
    }
}

void Writer::PutInt(long long value) {
    char digits[24];
    std::to_chars_result result = std::to_chars(digits, digits + sizeof digits, value);
    Put(digits, static_cast<std::size_t>(result.ptr - digits));
}

void Writer::PutRepeat(char c, std::size_t count) {
    while (count > 0) {
        if (used_ == capacity_) Drain();
        std::size_t room = capacity_ - used_;
        std::size_t chunk = count < room ? count : room;
        std::memset(buffer_.get() + used_, c, chunk);
        used_ += chunk;
        count -= chunk;
    }
}

bool Writer::Flush() {
    Drain();
    return error_ == 0;
}

}  // namespace Engine
}  // namespace Kitbase
