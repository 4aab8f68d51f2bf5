#include <norlithctl/RavelException.h>
#include <norlithctl/RavelObject.h>

namespace Ravel {
namespace Lib {

RavelException::RavelException(const std::string& text, const QuillMessage& message)
    : text_(text), quill_(message) {}

RavelException::RavelException(const std::string& text) : text_(text) {}

RavelException::~RavelException() noexcept {}

std::string RavelException::GetMessage(char form) const {
    if (form == 0 || quill_.IsEmpty()) return text_;
    std::string args;
    for (const std::string& arg : quill_.GetArgs()) args += (args.empty() ? "" : ", ") + arg;
    return text_ + " [" + quill_.GetId() + ": " + args + "]";
}

const char* RavelException::what() const noexcept { return text_.c_str(); }

RavelObject::~RavelObject() {}

}  // namespace Lib
}  // namespace Ravel
