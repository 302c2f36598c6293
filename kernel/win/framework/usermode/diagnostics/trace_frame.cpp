#include "kernel/win/framework/usermode/diagnostics/trace_frame.h"

#include "kernel/win/framework/usermode/diagnostics/trace.h"

namespace Kernel::UserMode::Diagnostics {

TraceFrame::TraceFrame(const wchar_t* name, std::uint32_t build, std::uint32_t defaultLevelMask,
                       std::uint32_t defaultOutput, std::uint32_t defaultFormat)
{
    TraceRedirectorInstance().Configure(name, build, defaultLevelMask, defaultOutput, defaultFormat);
}

TraceFrame::~TraceFrame()
{
    auto& sink = TraceRedirectorInstance();
    sink.RunLogRetention();
    if (IsTraceEnabled(2)) {
        const TraceSite site(&sink, 2, "T", __FILE__, __LINE__, "Kernel::UserMode::Diagnostics::TraceFrame::~TraceFrame");
        Print(site, "End\n");
    }
}

}  // namespace Kernel::UserMode::Diagnostics
