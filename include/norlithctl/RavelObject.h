// The common virtual base of host-control objects that the library hands out by pointer (advanced
// options, branches, modules and the like). The receiver owns such an object and deletes it
// through this base's virtual destructor.
#pragma once

#include <norlithctl/Export.h>

namespace Ravel {
namespace Lib {

class NORLITHCTL_API RavelObject {
public:
    virtual ~RavelObject();

protected:
    RavelObject();
    RavelObject(const RavelObject&);
};

}  // namespace Lib
}  // namespace Ravel
