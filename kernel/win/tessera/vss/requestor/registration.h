#pragma once

namespace Kernel::Tessera::Vss::Requestor {

// Self-registration of the classes, ProgIDs and application entry.
bool RegisterServer();
void UnregisterServer();

}  // namespace Kernel::Tessera::Vss::Requestor
