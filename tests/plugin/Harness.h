// What the plug-in's tests share: the command tree as the entry point builds it, running one
// command in-process against the current simulated host, and the registry of fault cases that
// the generic fault test (FaultTest.cpp) walks.
//
// A fault case is one successful invocation of a command (its path, its input, optionally the
// scenario of its host) and the form in which the command reports a host failure: the message
// form it reads (GetMessage(0) or (1)) and any fixed prefix. The generic test faults, in turn,
// every host operation the invocation calls and checks that the command reports the injected
// failure that way, sets no result and releases every host object. Operations whose failure a
// command treats otherwise (it escapes, is ignored, or becomes another message) are listed in
// the case's `special` outcomes. Each command's test file registers its cases with
// REGISTER_FAULT_CASE; the fault test also checks that every command of the tree has one.
#pragma once

#include <kitbase/AutoCli.h>
#include <kitbase/CallSpec.h>

#include <boost/shared_ptr.hpp>

#include <dlfcn.h>

#include <functional>
#include <map>
#include <ostream>
#include <string>
#include <vector>

extern "C" void AutoCli_RegisterNamespaces(boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root);

namespace plugintest {

typedef boost::shared_ptr<Kitbase::AutoCli::Command> CommandPtr;
typedef boost::shared_ptr<Kitbase::CallSpec::Input> InputPtr;
typedef boost::shared_ptr<Kitbase::CallSpec::Output> OutputPtr;

// The built plug-in as quarncli loads it (dlopen), kept loaded for the process: commands made by
// its factories must not outlive its code. Null when it cannot be loaded (dlerror() says why).
void* Plugin();

// A command made by the exported New() of the loaded plug-in, found by its mangled name; null
// when the plug-in or the symbol is missing.
template <class Command>
CommandPtr FromPlugin(const char* symbol);

// A fresh tree from the entry point, and the command at a path ("system version get").
boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> BuildTree();
CommandPtr FindCommand(const std::string& path);
// Every command path below root's "system", depth first (of a fresh tree when root is null).
std::vector<std::string> CommandPaths(
    boost::shared_ptr<Kitbase::AutoCli::NamespaceNode> root = boost::shared_ptr<Kitbase::AutoCli::NamespaceNode>());

// What one execution left behind.
struct Run {
    OutputPtr output;
    bool escaped = false;     // an exception left ExecuteInternal
    std::string exception;    // its GetMessage(0) (a RavelException) or what()
    long leaked = 0;          // host objects alive afterwards that were not before
};
// Executes command with input (empty input when null) and reports what happened.
Run Execute(const CommandPtr& command, const InputPtr& input = InputPtr());
// Executes command with the input fill makes, after emptying the call trace (which then holds
// this execution's host calls), and expects it neither to let an exception escape nor to leak.
Run ExecuteClean(const CommandPtr& command,
                 const std::function<void(Kitbase::CallSpec::Input&)>& fill = {});

// How a command answers one failing host operation.
struct Outcome {
    enum Kind { kReported, kEscapes, kIgnored };
    Kind kind = kReported;
    std::vector<std::string> errors;  // kReported: the errors in order ("{message}" stands for
                                      // the injected message in the command's form); empty:
                                      // the case's prefix followed by the message
    bool result = false;              // kReported: whether a result is set as well

    static Outcome Escapes() { return {kEscapes, {}, false}; }
    static Outcome Ignored() { return {kIgnored, {}, true}; }
    static Outcome Reported(std::vector<std::string> errors, bool result = false) {
        return {kReported, std::move(errors), result};
    }
};

// One invocation of a command and how it reports host failures, built fluently:
//   FaultCase("VersionGet", "system version get").Prefix("Unable to query product version: ")
struct FaultCase {
    FaultCase(std::string case_name, std::string command_path)
        : name(std::move(case_name)), path(std::move(command_path)) {}

    FaultCase& Make(std::function<CommandPtr()> factory) { make = std::move(factory); return *this; }
    // Runs before every execution (e.g. to reset process-wide state a command keeps).
    FaultCase& Before(std::function<void()> reset) { before = std::move(reset); return *this; }
    FaultCase& Input(std::function<void(Kitbase::CallSpec::Input&)> fill) { input = std::move(fill); return *this; }
    FaultCase& Scenario(std::string text) { scenario = std::move(text); return *this; }
    FaultCase& Form(char message_form) { form = message_form; return *this; }
    FaultCase& Prefix(std::string text) { prefix = std::move(text); return *this; }
    FaultCase& On(const std::string& operation, Outcome outcome) {
        special[operation] = std::move(outcome);
        return *this;
    }

    std::string name;                                      // unique, for test names
    std::string path;                                      // e.g. "system version get"
    std::function<CommandPtr()> make;                      // for a command the tree leaves out
    std::function<void()> before;                          // may be empty
    std::function<void(Kitbase::CallSpec::Input&)> input;  // fills the input; may be empty
    std::string scenario;                                  // the host's scenario; "" default
    char form = 0;                                         // GetMessage argument the command uses
    std::string prefix;                                    // text before the message
    std::map<std::string, Outcome> special;                // by qualified operation name
};

// Test names and failure messages show a case by its name.
inline void PrintTo(const FaultCase& fault_case, std::ostream* out) { *out << fault_case.name; }

const std::vector<FaultCase>& FaultCases();
bool RegisterFaultCase(FaultCase fault_case);

#define REGISTER_FAULT_CASE_CAT2(a, b) a##b
#define REGISTER_FAULT_CASE_CAT(a, b) REGISTER_FAULT_CASE_CAT2(a, b)
#define REGISTER_FAULT_CASE(...)                                                        \
    static const bool REGISTER_FAULT_CASE_CAT(fault_case_registered_, __LINE__) =      \
        ::plugintest::RegisterFaultCase(__VA_ARGS__)

template <class Command>
CommandPtr FromPlugin(const char* symbol) {
    typedef boost::shared_ptr<Command> (*Factory)();
    void* found = Plugin() ? dlsym(Plugin(), symbol) : nullptr;
    if (!found) return CommandPtr();
    return reinterpret_cast<Factory>(found)();
}

}  // namespace plugintest
