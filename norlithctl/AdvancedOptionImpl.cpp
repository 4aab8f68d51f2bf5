#include <norlithctl/AdvancedOptionImpl.h>

#include "AdvancedOptionState.h"
#include "HostCall.h"

namespace NorlithCtl {
namespace Adv {
namespace {

using simhost::Args;
using simhost::Call;
using simhost::Db;
using simhost::Op;
namespace advanced = simhost::advanced;

// The stored option at path; a change to an option that is gone is refused.
advanced::Option Stored(Db& db, const std::string& path) {
    std::optional<advanced::Option> option = advanced::FindOption(db, path);
    if (!option) throw advanced::OptionGone(path);
    return std::move(*option);
}

// Stages a new value (integer or text) of the option, checked against its rules now and again,
// against the option as the host holds it, when committed.
void StageValue(OptionState& state, Op operation, const nlohmann::ordered_json& value) {
    norlithctl::HostCall([&] {
        const std::string& path = state.stored.path;
        Call call(operation, Args().Add("path", path).Add("value", value));
        bool integer = value.is_number();
        if (integer)
            advanced::CheckIntegerValue(state.stored, value.get<std::uint64_t>());
        else
            advanced::CheckStringValue(state.stored, value.get<std::string>());
        state.stage.Add(path, value, [path, value, integer](Db& db) {
            advanced::Option option = Stored(db, path);
            if (integer) {
                advanced::CheckIntegerValue(option, value.get<std::uint64_t>());
                option.value = value.get<std::uint32_t>();
            } else {
                advanced::CheckStringValue(option, value.get<std::string>());
                option.text = value.get<std::string>();
            }
            advanced::PutOption(db, option);
        });
        state.pending = OptionState::Pending::kValue;
        if (integer)
            state.int_value = value.get<std::uint32_t>();
        else
            state.text_value = value.get<std::string>();
    });
}

}  // namespace

// ---- OptionState -------------------------------------------------------------------------------

std::uint32_t OptionState::IntValue() const {
    if (pending == Pending::kValue) return int_value;
    if (pending == Pending::kDefault) return stored.default_value;
    if (!stored.read_error.empty()) throw norlithctl::ToRavel(advanced::ReadError(stored));
    return stored.value;
}

std::string OptionState::TextValue() const {
    if (pending == Pending::kValue) return text_value;
    if (pending == Pending::kDefault) return stored.text_default;
    if (!stored.read_error.empty()) throw norlithctl::ToRavel(advanced::ReadError(stored));
    return stored.text;
}

void OptionState::ClearPending() {
    pending = Pending::kNone;
    stage.Discard();
}

Ravel::Adv::AdvancedOption* MakeOption(simhost::advanced::Option option) {
    bool integer = option.typed && option.kind == advanced::kInteger;
    bool text = option.typed && option.kind == advanced::kString;
    bool user = option.user;
    std::unique_ptr<OptionState> state(new OptionState);
    state->stored = std::move(option);
    if (integer && user) return new AdvancedUserIntegerOptionImpl(std::move(state));
    if (integer) return new AdvancedIntegerOptionImpl(std::move(state));
    if (text && user) return new AdvancedUserStringOptionImpl(std::move(state));
    if (text) return new AdvancedStringOptionImpl(std::move(state));
    return new AdvancedOptionImpl(std::move(state));
}

// ---- AdvancedOptionImpl ------------------------------------------------------------------------

Ravel::Adv::AdvancedOption* AdvancedOptionImpl::FindOption(const std::string& path) {
    std::optional<advanced::Option> found = norlithctl::HostCall([&] {
        Call call(Op::AdvOption_FindOption, Args().Add("path", path));
        return advanced::FindOption(call.db(), path);
    });
    return found ? MakeOption(std::move(*found)) : nullptr;
}

AdvancedOptionImpl::AdvancedOptionImpl(std::unique_ptr<OptionState> state) : state_(std::move(state)) {}

AdvancedOptionImpl::~AdvancedOptionImpl() {}

void AdvancedOptionImpl::Refresh() {
    norlithctl::HostCall([&] {
        Call call(Op::AdvOption_Refresh, Args().Add("path", state_->stored.path));
        state_->stored = Stored(call.db(), state_->stored.path);
    });
}

void AdvancedOptionImpl::Commit() {
    norlithctl::HostCall([&] {
        Call call(Op::AdvOption_Commit, Args().Add("path", state_->stored.path));
        if (state_->stage.Empty()) return;
        struct Cleared {
            OptionState& state;
            ~Cleared() { state.ClearPending(); }
        } cleared{*state_};
        state_->stage.Commit(call);
        state_->stored = Stored(call.db(), state_->stored.path);
    });
}

bool AdvancedOptionImpl::HasPendingChanges() { return !state_->stage.Empty(); }

void AdvancedOptionImpl::DiscardChanges() { state_->ClearPending(); }

std::string AdvancedOptionImpl::GetName() { return state_->stored.Name(); }

std::string AdvancedOptionImpl::ToString() { return "advanced option " + state_->stored.path; }

std::string AdvancedOptionImpl::GetPath() { return state_->stored.path; }

int AdvancedOptionImpl::GetType() { return state_->stored.kind; }

std::string AdvancedOptionImpl::GetDescription() { return state_->stored.description; }

void AdvancedOptionImpl::ResetToDefault() {
    norlithctl::HostCall([&] {
        const std::string path = state_->stored.path;
        Call call(Op::AdvOption_ResetToDefault, Args().Add("path", path));
        state_->stage.Add(path, nlohmann::ordered_json{{"reset_to_default", true}}, [path](Db& db) {
            advanced::Option option = Stored(db, path);
            option.value = option.default_value;
            option.text = option.text_default;
            advanced::PutOption(db, option);
        });
        state_->pending = OptionState::Pending::kDefault;
    });
}

// ---- the typed classes -------------------------------------------------------------------------

AdvancedIntegerOptionImpl::AdvancedIntegerOptionImpl(std::unique_ptr<OptionState> state)
    : AdvancedOptionImpl(std::move(state)) {}
AdvancedIntegerOptionImpl::~AdvancedIntegerOptionImpl() {}
std::uint32_t AdvancedIntegerOptionImpl::GetDefault() { return State().stored.default_value; }
std::uint32_t AdvancedIntegerOptionImpl::GetMin() { return State().stored.min; }
std::uint32_t AdvancedIntegerOptionImpl::GetMax() { return State().stored.max; }
std::uint32_t AdvancedIntegerOptionImpl::GetValue() { return State().IntValue(); }
void AdvancedIntegerOptionImpl::SetValue(std::uint32_t value) {
    StageValue(State(), Op::AdvIntegerOption_SetValue, value);
}

AdvancedUserIntegerOptionImpl::AdvancedUserIntegerOptionImpl(std::unique_ptr<OptionState> state)
    : AdvancedOptionImpl(std::move(state)) {}
AdvancedUserIntegerOptionImpl::~AdvancedUserIntegerOptionImpl() {}
std::uint32_t AdvancedUserIntegerOptionImpl::GetDefault() { return State().stored.default_value; }
std::uint32_t AdvancedUserIntegerOptionImpl::GetMin() { return State().stored.min; }
std::uint32_t AdvancedUserIntegerOptionImpl::GetMax() { return State().stored.max; }
std::uint32_t AdvancedUserIntegerOptionImpl::GetValue() { return State().IntValue(); }
void AdvancedUserIntegerOptionImpl::SetValue(std::uint32_t value) {
    StageValue(State(), Op::AdvUserIntegerOption_SetValue, value);
}

AdvancedStringOptionImpl::AdvancedStringOptionImpl(std::unique_ptr<OptionState> state)
    : AdvancedOptionImpl(std::move(state)) {}
AdvancedStringOptionImpl::~AdvancedStringOptionImpl() {}
std::string AdvancedStringOptionImpl::GetDefault() { return State().stored.text_default; }
std::string AdvancedStringOptionImpl::GetValidCharacters() { return State().stored.valid_characters; }
std::string AdvancedStringOptionImpl::GetValue() { return State().TextValue(); }
void AdvancedStringOptionImpl::SetValue(const std::string& value) {
    StageValue(State(), Op::AdvStringOption_SetValue, value);
}

AdvancedUserStringOptionImpl::AdvancedUserStringOptionImpl(std::unique_ptr<OptionState> state)
    : AdvancedOptionImpl(std::move(state)) {}
AdvancedUserStringOptionImpl::~AdvancedUserStringOptionImpl() {}
std::string AdvancedUserStringOptionImpl::GetDefault() { return State().stored.text_default; }
std::string AdvancedUserStringOptionImpl::GetValidCharacters() {
    return State().stored.valid_characters;
}
std::string AdvancedUserStringOptionImpl::GetValue() { return State().TextValue(); }
void AdvancedUserStringOptionImpl::SetValue(const std::string& value) {
    StageValue(State(), Op::AdvUserStringOption_SetValue, value);
}

}  // namespace Adv
}  // namespace NorlithCtl
