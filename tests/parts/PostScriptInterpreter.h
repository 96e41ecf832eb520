#pragma once

#include <memory>
#include <string>
#include <string_view>

namespace ventras {

/// The interpreter of a PostScript printer: a real Ghostscript, one run for each job that arrives. It works
/// beside the USB, as a printer's does: what it prints can be fetched when it is there. For
/// FakePrinter::interpreter; copies are the same interpreter. One thread at a time.
class PostScriptInterpreter {
public:
    /// @param prologue PostScript that makes the interpreter the printer's, run before each job
    /// @param hasPjl whether the printer switches languages by PJL commands
    explicit PostScriptInterpreter(std::string prologue, bool hasPjl = false);

    /// Takes bytes of jobs, which end with Control-D; perhaps none.
    /// @return what has been printed since the last call.
    std::string operator()(std::string_view data);

private:
    class Worker;
    std::shared_ptr<Worker> worker_;
    std::string pending_;
};

}  // namespace ventras
