#pragma once

#include <cstdint>

#include "kernel/win/framework/usermode/diagnostics/win32/trace_redirector_win.h"

namespace Kernel::UserMode::Diagnostics {

// The process-wide sink, made on first use.
Win32::TraceRedirector& TraceRedirectorInstance();

inline bool IsTraceEnabled(unsigned level)
{
    return TraceRedirectorInstance().IsEnabled(level);
}

// One record's call site, built on the stack only when its level is enabled.
struct TraceSite {
    TraceSite(Shared::Diagnostics::TraceRedirector* sink, std::uint32_t level, const char* tag, const char* file,
              std::uint32_t line, const char* function)
        : sink(sink), tag(tag), file(file), function(function), line(line), level(level)
    {
    }

    Shared::Diagnostics::TraceRedirector* sink;
    const char* tag;
    const char* file;
    const char* function;
    std::uint32_t line;
    std::uint32_t level;
};

void Print(const TraceSite& site, const wchar_t* format, ...);
void Print(const TraceSite& site, const char* format, ...);

}  // namespace Kernel::UserMode::Diagnostics

#if defined(_MSC_VER)
#define DIAG_FUNCTION __FUNCTION__
#else
#define DIAG_FUNCTION __func__
#endif

// The system's trace call: a level-2 record whose arguments are evaluated only
// when that level is enabled.
#define DIAG_TRACE(...)                                                                                        \
    do {                                                                                                       \
        if (::Kernel::UserMode::Diagnostics::IsTraceEnabled(2)) {                                              \
            const ::Kernel::UserMode::Diagnostics::TraceSite diagSite_(                                        \
                &::Kernel::UserMode::Diagnostics::TraceRedirectorInstance(), 2, "T", __FILE__, __LINE__,       \
                DIAG_FUNCTION);                                                                                \
            ::Kernel::UserMode::Diagnostics::Print(diagSite_, __VA_ARGS__);                                    \
        }                                                                                                      \
    } while (false)
