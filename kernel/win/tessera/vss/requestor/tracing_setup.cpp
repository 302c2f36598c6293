#include "kernel/win/tessera/vss/requestor/tracing_setup.h"

#include <cstdlib>
#include <new>

#include "common/build_identity.h"
#include "kernel/win/framework/usermode/diagnostics/settings.h"
#include "kernel/win/framework/usermode/diagnostics/trace_frame.h"

namespace Kernel::Tessera::Vss::Requestor {

namespace {

using Kernel::UserMode::Diagnostics::TraceFrame;

TraceFrame*& Frame()
{
    static TraceFrame* frame = nullptr;
    return frame;
}

void DeleteFrame()
{
    delete Frame();
    Frame() = nullptr;
}

}  // namespace

void InitTracing()
{
    static bool done = false;
    if (done) {
        return;
    }
    done = true;
    try {
        using namespace Kernel::UserMode::Diagnostics;
        const bool tracing = ReadDword(SettingsKey(L"Tessera").c_str(), L"VssRequestorTracing", 1) != 0;
        Frame() = new (std::nothrow) TraceFrame(L"VssRequestor", VSS_REQUESTOR_BUILD, tracing ? 7 : 0, 5, 1);
        std::atexit(DeleteFrame);
    } catch (...) {
        done = false;
        throw;
    }
}

}  // namespace Kernel::Tessera::Vss::Requestor
