// The host-control library's error type and the event record it carries.
//
// Every host-control operation may throw Ravel::Lib::RavelException; plug-ins throw it too for
// their own validation failures. The exception owns copies of its text and of its QuillMessage.
//
// A QuillMessage names an event of the host's event catalog and carries its arguments; the
// catalog gives each event a text with {0}, {1}, ... for the arguments (docs/simhost.md lists
// it). Host errors raised by faults or rules that carry an event fill it in.
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

    // The message. The argument selects the form: 0 the plain text; any other value the text
    // formed from the event record (the catalog's text of its event with its arguments filled
    // in; an event the catalog lacks gives "id(arg, ...)"), or the plain text when the record
    // is empty.
    virtual std::string GetMessage(char form) const;
    const QuillMessage& GetQuillMessage() const { return quill_; }

    const char* what() const noexcept override;

private:
    std::string text_;
    QuillMessage quill_;
};

}  // namespace Lib
}  // namespace Ravel
