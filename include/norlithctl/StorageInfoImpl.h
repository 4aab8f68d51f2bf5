// NorlithCtl::Storage::StorageInfoImpl: the host's storage as far as core dumps go: the
// diagnostic partitions of its disks and the dump files on its datastores, each with an active
// target (used by the running kernel) and a configured one (used from the next boot).
// NorlithCtl::Storage::DiagnosticFileImpl: a dump file named by its path.
//
// Built per command on the stack. Every Get... operation that returns a pointer hands out a new
// object the caller owns (null when there is none); the vectors' elements are the caller's too,
// none null. The rules these operations enforce are written down in docs/host/coredump.md.
//
// The constructor and every operation may throw Ravel::Lib::RavelException: the host cannot be
// reached, a fault set on the operation, or a refusal with a clear message (an unknown or
// unsuitable partition, a size, name or datastore the host does not accept, nothing to
// activate). A refused change leaves the host as it was; a throwing operation hands out nothing.
#pragma once

#include <norlithctl/Diagnostic.h>
#include <norlithctl/Export.h>
#include <norlithctl/Testing.h>

#include <cstdint>
#include <string>
#include <vector>

namespace NorlithCtl {
namespace Storage {

class NORLITHCTL_API StorageInfoImpl {
public:
    StorageInfoImpl();
    virtual ~StorageInfoImpl();

    // ---- diagnostic partitions
    // The partition the kernel dumps to now; null when none is active.
    virtual Ravel::Storage::DiagnosticPartition* GetActiveDiagnosticPartition();
    // The partition configured for the next boot; null when none is configured. Throws when the
    // configured name matches no partition of the host any more.
    virtual Ravel::Storage::DiagnosticPartition* GetConfiguredDiagnosticPartition();
    // Every partition of the diagnostic type, in disk order.
    virtual std::vector<Ravel::Storage::DiagnosticPartition*> GetPotentialDiagnosticPartitions();
    // Makes the configured partition the active one; throws when none is configured or it is
    // no diagnostic partition of the host.
    virtual void ActivateDiagnosticPartition();
    // Makes the smart selection's partition the active one (docs/host/coredump.md); throws when
    // the host has no diagnostic partition.
    virtual void SmartActivateDiagnosticPartition();
    virtual void DeactivateDiagnosticPartition();
    virtual void UnconfigureDiagnosticPartition();
    // Configures the named diagnostic partition for the next boot and, with activate, makes it
    // the active one now; throws for a name that is not a diagnostic partition of the host.
    virtual void SetDiagnosticPartition(const std::string& name, bool activate);

    // ---- dump files
    // Creates a pre-allocated sparse dump file of size MB (0: the default size) on datastore
    // ("": the one with the most free space) under name ("": a unique one).
    virtual void CreateDiagnosticFile(std::uint64_t size, const std::string& datastore,
                                      const std::string& name);
    // As CreateDiagnosticFile, then activates and configures the new file, but only when the
    // host has no valid dump file and its kernel setting autoCreateDumpFile is TRUE; otherwise
    // it does nothing.
    virtual void AutoAddDiagnosticFile(std::uint64_t size, const std::string& datastore,
                                       const std::string& name);
    // The active and the configured file (null when none), whether or not the file is valid.
    virtual Ravel::Storage::DiagnosticFile* GetActiveDiagnosticFile();
    virtual Ravel::Storage::DiagnosticFile* GetConfiguredDiagnosticFile();
    // Every dump file the host knows, in its order, each examined once.
    virtual std::vector<Ravel::Storage::DiagnosticFile*> GetPotentialDiagnosticFiles();
    // Makes the configured file the active one; throws when none is configured or it is not a
    // valid dump file.
    virtual void ActivateDiagnosticFile();
    // Makes the best valid dump file the active one: the configured one when valid, else the
    // largest known one; throws when the host has none.
    virtual void SmartActivateDiagnosticFile();
    virtual void DeactivateDiagnosticFile();
    virtual void UnconfigureDiagnosticFile();
    // Configures the valid dump file at path for the next boot and, with activate, makes it the
    // active one now; throws for a path that holds no valid dump file.
    virtual void SetDiagnosticFile(const std::string& path, bool activate);

private:
    StorageInfoImpl(const StorageInfoImpl&);
    StorageInfoImpl& operator=(const StorageInfoImpl&);

    LiveObject live_;
};

// A dump file named by a path; it reads the host when first asked whether it is valid or how
// large it is.
class NORLITHCTL_API DiagnosticFileImpl : public Ravel::Storage::DiagnosticFile {
public:
    explicit DiagnosticFileImpl(const std::string& path);
    virtual ~DiagnosticFileImpl();

    std::string GetPath() override;
    bool IsValid(bool reread) override;
    std::int64_t GetSize() override;

    void Refresh() override;
    void Commit() override;
    bool HasPendingChanges() override;
    void DiscardChanges() override;
    // The last component of the path.
    std::string GetName() override;
    std::string ToString() override;

    // A file as it was examined while a list was read (no further host call needed).
    DiagnosticFileImpl(const std::string& path, bool valid, std::int64_t size);

private:
    void Examine(int operation);

    std::string path_;
    bool examined_ = false;
    bool valid_ = false;
    std::int64_t size_ = 0;
};

}  // namespace Storage
}  // namespace NorlithCtl
