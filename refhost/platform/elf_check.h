// Checks a module file before the system loader maps it: the loader trusts the file's program
// headers, and a segment that lies past the end of a truncated file faults (SIGBUS) on first use.
#pragma once

#include <string>

namespace refhost {

// Empty when the file is an ELF shared object of this process's class, byte order and machine
// whose program-header segments all lie within the file; otherwise one sentence saying what is
// wrong (the caller adds the path). Only POSIX builds load ELF modules.
std::string elfModuleProblem(const std::string& path);

}  // namespace refhost
