// Running plug-in code (a command's declarations or its execution) without letting an exception
// end the program: the exception becomes one message line instead.
//
// A Ravel::Lib::RavelException gives its GetMessage(0) text as it is; anything else gives
// "quarncli: internal error in <what>: <what()>" (or "out of memory in <what>").
#pragma once

#include "cli/Cli.h"

#include <norlithctl/RavelException.h>

#include <exception>
#include <new>
#include <string>

namespace Kitbase {
namespace Cli {

// Runs work; false with *failure set to the one line when an exception escaped it.
template <class Work>
bool Guard(const std::string& what, Work work, std::string* failure) {
    try {
        work();
        return true;
    } catch (const Ravel::Lib::RavelException& e) {
        *failure = e.GetMessage(0);
    } catch (const std::bad_alloc&) {
        *failure = std::string(kProgramName) + ": out of memory in " + what;
    } catch (const std::exception& e) {
        *failure = std::string(kProgramName) + ": internal error in " + what + ": " + e.what();
    } catch (...) {
        *failure = std::string(kProgramName) + ": internal error in " + what +
                   ": an exception of unknown type";
    }
    return false;
}

}  // namespace Cli
}  // namespace Kitbase
