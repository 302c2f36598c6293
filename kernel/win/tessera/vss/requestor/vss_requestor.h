#pragma once

namespace Kernel::Tessera::Vss::Requestor {

// The process's main function: decides from the first argument what the process
// does and returns its exit code (0 or 1).
int Run(int argc, wchar_t** argv);

}  // namespace Kernel::Tessera::Vss::Requestor
