#include "kernel/win/tessera/vss/requestor/registration.h"

#include "kernel/win/framework/usermode/diagnostics/trace.h"

namespace Kernel::Tessera::Vss::Requestor {

// The class objects are not published yet, so there is nothing to register:
// report failure rather than a registration that did not happen.
bool RegisterServer()
{
    DIAG_TRACE(L"RegisterServer: self-registration is not available in this build\n");
    return false;
}

void UnregisterServer()
{
    DIAG_TRACE(L"UnregisterServer: nothing is registered by this build\n");
}

}  // namespace Kernel::Tessera::Vss::Requestor
