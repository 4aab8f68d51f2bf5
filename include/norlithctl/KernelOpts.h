// NorlithCtl::System::KernelOpts: the host kernel's boot-time settings.
//
// Each setting has a name, a type, a description, a default, a configured value (the one the
// kernel uses from the next boot) and a runtime value (the one the running kernel uses; "" when
// the kernel reports none). Every value is text. Built per command on the stack; it holds no
// state and reads or changes the host on every call.
//
// Construction and every operation may throw Ravel::Lib::RavelException: the host cannot be
// reached, a fault, a name the host does not know ("Unknown kernel setting 'x' (nearest: ...)"),
// or a value SetOption refuses for the setting's type (naming the value, the setting and what
// the type accepts).
#pragma once

#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <string>
#include <vector>

namespace Ravel {
namespace System {

class NORLITHCTL_API KernelOption {
public:
    // The type of a setting's values. The host knows these; a value outside them is a type this
    // library does not know ("unknown").
    enum OptionType : int {
        OptionTypeString = 0,
        OptionTypeBool = 1,    // TRUE or FALSE
        OptionTypeUint32 = 2,  // unsigned numbers: decimal, 0x hexadecimal, 0 octal
        OptionTypeUint8 = 3,
        OptionTypeUint16 = 4,
        OptionTypeUint64 = 5,
    };
};

}  // namespace System
}  // namespace Ravel

namespace NorlithCtl {
namespace System {

class NORLITHCTL_API KernelOpts {
public:
    KernelOpts();
    virtual ~KernelOpts();

    // Every setting's name, in the host's order.
    virtual std::vector<std::string> GetOptionNames();
    virtual Ravel::System::KernelOption::OptionType GetOptionType(const std::string& name);
    // The type's name: "string", "bool", "uint32", "uint8", "uint16", "uint64" or "unknown".
    virtual std::string GetOptionTypeString(Ravel::System::KernelOption::OptionType type);
    virtual std::string GetOptionDescription(const std::string& name);
    // The configured value, used from the next boot.
    virtual std::string GetOption(const std::string& name);
    // The running kernel's value; "" when it reports none.
    virtual std::string GetRuntimeValue(const std::string& name);
    virtual std::string GetOptionDefault(const std::string& name);
    // Sets the configured value, after checking it against the setting's type; the runtime value
    // follows at the next boot.
    virtual void SetOption(const std::string& name, const std::string& value);

private:
    KernelOpts(const KernelOpts&);
    KernelOpts& operator=(const KernelOpts&);

    LiveObject live_;
};

}  // namespace System
}  // namespace NorlithCtl
