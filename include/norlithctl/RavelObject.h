// The common virtual base of host-control objects that the library hands out by pointer (advanced
// options, modules and the like). The receiver owns such an object and deletes it through this
// base's virtual destructor. Every object counts itself while it lives (Testing.h), so tests can
// check that a caller released everything it received.
//
// Host objects are snapshots with staged changes: the getters of a derived interface read what
// the object holds, setters stage changes, Commit applies the staged changes to the host at once
// and Refresh reads the host's current state again. Refresh and Commit may throw
// Ravel::Lib::RavelException (the host cannot be reached, a fault, a rule that refuses a staged
// change: then nothing of it was applied). The virtual operations keep this slot order:
// destructor, deleting destructor, Refresh, Commit, HasPendingChanges, DiscardChanges, GetName,
// ToString.
#pragma once

#include <norlithctl/Export.h>

#include <string>

namespace Ravel {
namespace Lib {

class NORLITHCTL_API RavelObject {
public:
    virtual ~RavelObject();

    // Reads the object's state from the host again; changes staged and not yet committed stay
    // staged and still show through the getters.
    virtual void Refresh() = 0;
    // Applies every staged change to the host in one step (journaled as one entry); afterwards
    // nothing is staged. A change the host refuses refuses them all and leaves the host as it was.
    virtual void Commit() = 0;
    // Whether changes are staged and not yet committed.
    virtual bool HasPendingChanges() = 0;
    // Drops the staged changes without applying them.
    virtual void DiscardChanges() = 0;
    // The object's own name: the last component of an option's path, a module's name.
    virtual std::string GetName() = 0;
    // One line naming the object for logs and messages, e.g. "advanced option /Net/TcpMss".
    virtual std::string ToString() = 0;

protected:
    RavelObject();
    RavelObject(const RavelObject&);

private:
    RavelObject& operator=(const RavelObject&);
};

}  // namespace Lib
}  // namespace Ravel
