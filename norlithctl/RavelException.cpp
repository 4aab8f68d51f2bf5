#include <norlithctl/RavelException.h>
#include <norlithctl/RavelObject.h>
#include <norlithctl/Testing.h>

#include "HostCall.h"

#include <simhost/Events.h>

#include <atomic>

namespace norlithctl {
namespace {
std::atomic<long> g_live{0};
}  // namespace

}  // namespace norlithctl

namespace NorlithCtl {
namespace Testing {
long LiveObjects() { return norlithctl::g_live.load(); }
}  // namespace Testing

LiveObject::LiveObject() { ++norlithctl::g_live; }
LiveObject::LiveObject(const LiveObject&) { ++norlithctl::g_live; }
LiveObject::~LiveObject() { --norlithctl::g_live; }
}  // namespace NorlithCtl

namespace Ravel {
namespace Lib {

RavelException::RavelException(const std::string& text, const QuillMessage& message)
    : text_(text), quill_(message) {}

RavelException::RavelException(const std::string& text) : text_(text) {}

RavelException::~RavelException() noexcept {}

std::string RavelException::GetMessage(char form) const {
    if (form == 0 || quill_.IsEmpty()) return text_;
    return simhost::FormatEvent(simhost::Event{quill_.GetId(), quill_.GetArgs()});
}

const char* RavelException::what() const noexcept { return text_.c_str(); }

RavelObject::RavelObject() { ++norlithctl::g_live; }
RavelObject::RavelObject(const RavelObject&) { ++norlithctl::g_live; }
RavelObject::~RavelObject() { --norlithctl::g_live; }

}  // namespace Lib
}  // namespace Ravel
