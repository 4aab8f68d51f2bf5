// The advanced option interfaces' destructors: their one definition, which anchors each
// interface's virtual table and type information in the library.
#include <norlithctl/AdvancedOption.h>

namespace Ravel {
namespace Adv {

AdvancedOption::~AdvancedOption() {}
AdvancedIntegerOption::~AdvancedIntegerOption() {}
AdvancedStringOption::~AdvancedStringOption() {}
AdvancedOptionBranch::~AdvancedOptionBranch() {}

}  // namespace Adv
}  // namespace Ravel
