#pragma once

#include <cstdint>

namespace Kernel::UserMode::Diagnostics {

// The process's tracing scope: configures the sink when made; when destroyed,
// runs log retention and writes the last record.
class TraceFrame {
public:
    TraceFrame(const wchar_t* name, std::uint32_t build, std::uint32_t defaultLevelMask, std::uint32_t defaultOutput,
               std::uint32_t defaultFormat);
    ~TraceFrame();
    TraceFrame(const TraceFrame&) = delete;
    TraceFrame& operator=(const TraceFrame&) = delete;
};

}  // namespace Kernel::UserMode::Diagnostics
