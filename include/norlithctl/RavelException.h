// The host-control library's error type and the event record it carries.
//
// Every host-control operation may throw Ravel::Lib::RavelException; plug-ins throw it too for
// their own validation failures. The exception owns copies of its text and of its QuillMessage.
#pragma once

#include <norlithctl/Export.h>

#include <exception>
#include <string>
#include <vector>

namespace Ravel {
namespace Lib {

// A structured event record: an event identifier and its arguments. Default-constructed, it is
// empty (no identifier, no arguments).
class NORLITHCTL_API QuillMessage {
public:
    QuillMessage() {}
    explicit QuillMessage(const std::string& id, const std::vector<std::string>& args = {})
        : id_(id), args_(args) {}

    const std::string& GetId() const { return id_; }
    const std::vector<std::string>& GetArgs() const { return args_; }
    bool IsEmpty() const { return id_.empty() && args_.empty(); }

private:
    std::string id_;
    std::vector<std::string> args_;
};

class NORLITHCTL_API RavelException : public std::exception {
public:
    RavelException(const std::string& text, const QuillMessage& message);
    explicit RavelException(const std::string& text);
    ~RavelException() noexcept override;

    // The message text. The argument selects the form: 0 the plain text; any other value the
    // text followed, when the event record is not empty, by " [" id ": " args joined by ", " "]".
    virtual std::string GetMessage(char form) const;
    const QuillMessage& GetQuillMessage() const { return quill_; }

    const char* what() const noexcept override;

private:
    std::string text_;
    QuillMessage quill_;
};

}  // namespace Lib
}  // namespace Ravel
