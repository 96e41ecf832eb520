#pragma once

#include "ctl/CommandLine.h"
#include "ctl/Exit.h"
#include "ctl/Translation.h"

namespace ventras {

class Output;

inline constexpr Option kPackageOptions[] = {
    {"file", "FILE", translatable("lookup: in this catalogue, instead of the installed one")},
    {"output", "FILE",
     translatable("build: keep the catalogue there; without, only show what it would cover")},
    {"release", "RELEASE",
     translatable("build: for this release, instead of this system's, e.g. \"debian 12\"")},
};

/// The catalogue of driver packages: what it says of a device ("lookup ID"), and how it is made from unpacked
/// packages ("build DIR...").
Exit showPackages(const Arguments& arguments, Output& output);

}  // namespace ventras
