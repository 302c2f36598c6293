#pragma once

namespace Kernel::Tessera::Vss::Requestor {

// Configures the process's tracing; only the first call does anything. Called
// first by Run and by every CreateInstance.
void InitTracing();

}  // namespace Kernel::Tessera::Vss::Requestor
