#include <norlithctl/StorageInfoImpl.h>

#include "HostCall.h"

#include <simhost/RootFs.h>
#include <simhost/domains/Coredump.h>
#include <simhost/domains/KernelSettings.h>

#include "util/Text.h"

#include <memory>
#include <optional>

namespace Ravel {
namespace Storage {
DiagnosticPartition::DiagnosticPartition() {}
DiagnosticPartition::~DiagnosticPartition() {}
DiagnosticFile::DiagnosticFile() {}
DiagnosticFile::~DiagnosticFile() {}
}  // namespace Storage
}  // namespace Ravel

namespace NorlithCtl {
namespace Storage {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::HostError;
using simhost::Op;
namespace coredump = simhost::coredump;

// A partition as the host had it when it was read.
class DiagnosticPartitionImpl : public Ravel::Storage::DiagnosticPartition {
public:
    explicit DiagnosticPartitionImpl(coredump::PartitionView view) : view_(std::move(view)) {}

    std::string GetName() override { return view_.name; }
    std::string GetPath() override { return view_.path; }

    void Refresh() override {
        norlithctl::HostCall([&] {
            Call call(Op::DiagnosticPartitionImpl_Refresh, Args().Add("name", view_.name));
            std::optional<coredump::PartitionView> now =
                coredump::FindPartition(call.Read<coredump::Partitions>(), view_.name);
            if (!now) throw HostError("Partition " + view_.name + " is no longer on the host");
            view_ = std::move(*now);
        });
    }
    void Commit() override {}
    bool HasPendingChanges() override { return false; }
    void DiscardChanges() override {}
    std::string ToString() override { return "diagnostic partition " + view_.name; }

private:
    coredump::PartitionView view_;
};

Ravel::Storage::DiagnosticPartition* Hand(const std::optional<coredump::PartitionView>& view) {
    return view ? new DiagnosticPartitionImpl(*view) : nullptr;
}

// The configured partition's view; "" configured is none, a name the host lacks is an error.
std::optional<coredump::PartitionView> Configured(const coredump::Partitions& state) {
    if (state.configured.empty()) return std::nullopt;
    std::optional<coredump::PartitionView> view = coredump::FindPartition(state, state.configured);
    if (!view)
        throw HostError("The configured dump partition " + state.configured +
                        " is not a partition of this host");
    return view;
}

// The named partition, which must be a diagnostic partition of the host.
coredump::PartitionView Diagnostic(const coredump::Partitions& state, const std::string& name) {
    std::optional<coredump::PartitionView> view = coredump::FindPartition(state, name);
    if (!view) {
        std::string text = "Unknown partition " + quarn::util::Quote(name);
        std::vector<coredump::PartitionView> diagnostic = coredump::DiagnosticPartitions(state);
        if (diagnostic.empty()) throw HostError(text + "; this host has no diagnostic partitions");
        text += "; the diagnostic partitions of this host are:";
        for (std::size_t i = 0; i < diagnostic.size() && i < 10; ++i) text += (i ? ", " : " ") + diagnostic[i].name;
        if (diagnostic.size() > 10) text += ", ...";
        throw HostError(text);
    }
    if (view->type != "diagnostic")
        throw HostError("Partition " + name + " is a " + view->type +
                        " partition, not a diagnostic partition");
    return *view;
}

Ravel::Storage::DiagnosticFile* HandFile(Call& call, const std::string& path) {
    if (path.empty()) return nullptr;
    coredump::FileCheck check = coredump::ExamineFile(call.Root(), path);
    return new DiagnosticFileImpl(path, check.Valid(), check.length);
}

// The valid dump file at path, or the reason it is not one.
void RequireValid(Call& call, const std::string& path) {
    coredump::FileCheck check = coredump::ExamineFile(call.Root(), path);
    if (!check.exists) throw HostError("No dump file at " + path + ": the file does not exist");
    if (!check.header) throw HostError(path + " is not a dump file: it does not start with the dump-file header");
    if (!check.Valid())
        throw HostError("Dump file " + path + " is damaged: its header names " +
                        std::to_string(check.header_mb) + " MB, the file holds " +
                        std::to_string(check.length) + " bytes");
}

Args SizeArgs(std::uint64_t size, const std::string& datastore, const std::string& name) {
    return Args().Add("size", size).Add("datastore", datastore).Add("file", name);
}

}  // namespace

StorageInfoImpl::StorageInfoImpl() {
    norlithctl::HostCall([] { Call call(Op::StorageInfoImpl_New); });
}

StorageInfoImpl::~StorageInfoImpl() {}

// ---- partitions -----------------------------------------------------------------------------

Ravel::Storage::DiagnosticPartition* StorageInfoImpl::GetActiveDiagnosticPartition() {
    return Hand(norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_GetActiveDiagnosticPartition);
        coredump::Partitions state = coredump::LoadForLookUp(call.db());
        return state.active.empty() ? std::nullopt : coredump::FindPartition(state, state.active);
    }));
}

Ravel::Storage::DiagnosticPartition* StorageInfoImpl::GetConfiguredDiagnosticPartition() {
    return Hand(norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_GetConfiguredDiagnosticPartition);
        return Configured(coredump::LoadForLookUp(call.db()));
    }));
}

std::vector<Ravel::Storage::DiagnosticPartition*> StorageInfoImpl::GetPotentialDiagnosticPartitions() {
    std::vector<coredump::PartitionView> views = norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_GetPotentialDiagnosticPartitions);
        return coredump::DiagnosticPartitions(call.Read<coredump::Partitions>());
    });
    std::vector<std::unique_ptr<Ravel::Storage::DiagnosticPartition>> owned;
    owned.reserve(views.size());
    for (coredump::PartitionView& view : views) owned.emplace_back(new DiagnosticPartitionImpl(std::move(view)));
    std::vector<Ravel::Storage::DiagnosticPartition*> partitions;
    partitions.reserve(owned.size());
    for (auto& partition : owned) partitions.push_back(partition.release());
    return partitions;
}

void StorageInfoImpl::ActivateDiagnosticPartition() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_ActivateDiagnosticPartition);
        coredump::Partitions state = call.Read<coredump::Partitions>();
        if (state.configured.empty())
            throw HostError("No dump partition is configured to activate: set one with --partition, or use --smart");
        coredump::PartitionView view = Diagnostic(state, state.configured);
        call.Update<coredump::Partitions>([&](coredump::Partitions& s) { s.active = view.name; });
    });
}

void StorageInfoImpl::SmartActivateDiagnosticPartition() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_SmartActivateDiagnosticPartition);
        std::string chosen = coredump::SmartPartition(call.Read<coredump::Partitions>());
        if (chosen.empty()) throw HostError("This host has no diagnostic partition to activate");
        call.Update<coredump::Partitions>([&](coredump::Partitions& s) { s.active = chosen; });
    });
}

void StorageInfoImpl::DeactivateDiagnosticPartition() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_DeactivateDiagnosticPartition);
        call.Update<coredump::Partitions>([](coredump::Partitions& s) { s.active.clear(); });
    });
}

void StorageInfoImpl::UnconfigureDiagnosticPartition() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_UnconfigureDiagnosticPartition);
        call.Update<coredump::Partitions>([](coredump::Partitions& s) { s.configured.clear(); });
    });
}

void StorageInfoImpl::SetDiagnosticPartition(const std::string& name, bool activate) {
    norlithctl::HostCall([&] {
        Call call(Op::StorageInfoImpl_SetDiagnosticPartition, Args().Add("name", name).Add("activate", activate));
        coredump::PartitionView view = Diagnostic(call.Read<coredump::Partitions>(), name);
        call.Update<coredump::Partitions>([&](coredump::Partitions& s) {
            s.configured = view.name;
            if (activate) s.active = view.name;
        });
    });
}

// ---- files ----------------------------------------------------------------------------------

void StorageInfoImpl::CreateDiagnosticFile(std::uint64_t size, const std::string& datastore,
                                           const std::string& name) {
    norlithctl::HostCall([&] {
        Call call(Op::StorageInfoImpl_CreateDiagnosticFile, SizeArgs(size, datastore, name));
        // The file is made inside the write transaction: if the state cannot be stored, the
        // transaction's failure leaves the file behind, so it is removed again.
        std::string made;
        try {
            call.Update<coredump::Files>([&](coredump::Files& state) {
                made = coredump::CreateFile(state, call.Root(), size, datastore, name);
            });
        } catch (...) {
            if (!made.empty()) simhost::RootFs(call.Root()).Unlink(made);
            throw;
        }
    });
}

void StorageInfoImpl::AutoAddDiagnosticFile(std::uint64_t size, const std::string& datastore,
                                            const std::string& name) {
    norlithctl::HostCall([&] {
        Call call(Op::StorageInfoImpl_AutoAddDiagnosticFile, SizeArgs(size, datastore, name));
        std::optional<simhost::kernel_settings::Setting> setting =
            simhost::kernel_settings::Find(call.db(), "autoCreateDumpFile");
        // The running kernel's value decides; a setting the kernel does not report counts as
        // its configured value.
        const bool allowed = setting && simhost::kernel_settings::IsTrue(setting->runtime.value_or(setting->configured));
        if (!allowed) return;
        coredump::Files state = call.Read<coredump::Files>();
        for (const coredump::DumpFile& file : state.files)
            if (coredump::ExamineFile(call.Root(), file.path).Valid()) return;
        std::string made;
        try {
            call.Update<coredump::Files>([&](coredump::Files& s) {
                made = coredump::CreateFile(s, call.Root(), size, datastore, name);
                s.active = made;
                s.configured = made;
            });
        } catch (...) {
            if (!made.empty()) simhost::RootFs(call.Root()).Unlink(made);
            throw;
        }
    });
}

Ravel::Storage::DiagnosticFile* StorageInfoImpl::GetActiveDiagnosticFile() {
    return norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_GetActiveDiagnosticFile);
        return HandFile(call, call.Read<coredump::Files>().active);
    });
}

Ravel::Storage::DiagnosticFile* StorageInfoImpl::GetConfiguredDiagnosticFile() {
    return norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_GetConfiguredDiagnosticFile);
        return HandFile(call, call.Read<coredump::Files>().configured);
    });
}

std::vector<Ravel::Storage::DiagnosticFile*> StorageInfoImpl::GetPotentialDiagnosticFiles() {
    std::vector<std::unique_ptr<Ravel::Storage::DiagnosticFile>> owned;
    norlithctl::HostCall([&] {
        Call call(Op::StorageInfoImpl_GetPotentialDiagnosticFiles);
        coredump::Files state = call.Read<coredump::Files>();
        owned.reserve(state.files.size());
        for (const coredump::DumpFile& file : state.files) owned.emplace_back(HandFile(call, file.path));
    });
    std::vector<Ravel::Storage::DiagnosticFile*> files;
    files.reserve(owned.size());
    for (auto& file : owned) files.push_back(file.release());
    return files;
}

void StorageInfoImpl::ActivateDiagnosticFile() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_ActivateDiagnosticFile);
        coredump::Files state = call.Read<coredump::Files>();
        if (state.configured.empty())
            throw HostError("No dump file is configured to activate: set one with --path, or use --smart");
        RequireValid(call, state.configured);
        call.Update<coredump::Files>([&](coredump::Files& s) { s.active = state.configured; });
    });
}

void StorageInfoImpl::SmartActivateDiagnosticFile() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_SmartActivateDiagnosticFile);
        coredump::Files state = call.Read<coredump::Files>();
        std::string chosen;
        if (!state.configured.empty() && coredump::ExamineFile(call.Root(), state.configured).Valid()) {
            chosen = state.configured;
        } else {
            std::int64_t largest = -1;
            for (const coredump::DumpFile& file : state.files) {
                coredump::FileCheck check = coredump::ExamineFile(call.Root(), file.path);
                if (check.Valid() && check.length > largest) {
                    largest = check.length;
                    chosen = file.path;
                }
            }
        }
        if (chosen.empty()) throw HostError("This host has no valid dump file to activate");
        call.Update<coredump::Files>([&](coredump::Files& s) { s.active = chosen; });
    });
}

void StorageInfoImpl::DeactivateDiagnosticFile() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_DeactivateDiagnosticFile);
        call.Update<coredump::Files>([](coredump::Files& s) { s.active.clear(); });
    });
}

void StorageInfoImpl::UnconfigureDiagnosticFile() {
    norlithctl::HostCall([] {
        Call call(Op::StorageInfoImpl_UnconfigureDiagnosticFile);
        call.Update<coredump::Files>([](coredump::Files& s) { s.configured.clear(); });
    });
}

void StorageInfoImpl::SetDiagnosticFile(const std::string& path, bool activate) {
    norlithctl::HostCall([&] {
        Call call(Op::StorageInfoImpl_SetDiagnosticFile, Args().Add("path", path).Add("activate", activate));
        if (!simhost::IsHostPath(path) || !coredump::IsNormalHostPath(path))
            throw HostError("Dump file path " + quarn::util::Quote(path) + " is not a normalised absolute host path");
        RequireValid(call, path);
        call.Update<coredump::Files>([&](coredump::Files& s) {
            s.configured = path;
            if (activate) s.active = path;
        });
    });
}

// ---- one dump file --------------------------------------------------------------------------

DiagnosticFileImpl::DiagnosticFileImpl(const std::string& path) : path_(path) {}

DiagnosticFileImpl::DiagnosticFileImpl(const std::string& path, bool valid, std::int64_t size)
    : path_(path), examined_(true), valid_(valid), size_(size) {}

DiagnosticFileImpl::~DiagnosticFileImpl() {}

std::string DiagnosticFileImpl::GetPath() { return path_; }

void DiagnosticFileImpl::Examine(int operation) {
    norlithctl::HostCall([&] {
        Call call(static_cast<Op>(operation), Args().Add("path", path_));
        coredump::FileCheck check = coredump::ExamineFile(call.Root(), path_);
        valid_ = check.Valid();
        size_ = check.exists ? check.length : 0;
        examined_ = true;
    });
}

bool DiagnosticFileImpl::IsValid(bool reread) {
    if (reread || !examined_) Examine(static_cast<int>(Op::DiagnosticFileImpl_IsValid));
    return valid_;
}

std::int64_t DiagnosticFileImpl::GetSize() {
    if (!examined_) Examine(static_cast<int>(Op::DiagnosticFileImpl_GetSize));
    return size_;
}

void DiagnosticFileImpl::Refresh() { Examine(static_cast<int>(Op::DiagnosticFileImpl_Refresh)); }
void DiagnosticFileImpl::Commit() {}
bool DiagnosticFileImpl::HasPendingChanges() { return false; }
void DiagnosticFileImpl::DiscardChanges() {}

std::string DiagnosticFileImpl::GetName() { return path_.substr(path_.rfind('/') + 1); }

std::string DiagnosticFileImpl::ToString() { return "dump file " + path_; }

}  // namespace Storage
}  // namespace NorlithCtl
