#pragma once

#include <windows.h>

#include <cstdarg>
#include <cstdint>
#include <string>

#include "kernel/win/framework/usermode/diagnostics/trace_formatter.h"

namespace Kernel::Shared::Diagnostics {

// What a record says about where it was written.
struct TraceLocation {
    const char* tag;
    const char* file;      // base name
    const char* function;  // short name
    int line;
};

class TraceRedirector {
public:
    virtual ~TraceRedirector() = default;
    virtual void PrintW(unsigned level, const TraceLocation& location, const wchar_t* format, va_list args) = 0;
    virtual void PrintA(unsigned level, const TraceLocation& location, const char* format, va_list args) = 0;
};

}  // namespace Kernel::Shared::Diagnostics

namespace Kernel::UserMode::Diagnostics {

// Output flags (TraceOutput).
constexpr std::uint32_t OutputFile = 0x1;
constexpr std::uint32_t OutputConsole = 0x2;
constexpr std::uint32_t OutputDebugger = 0x4;

// Format flags (TraceFormat).
constexpr std::uint32_t FormatTimestamp = 0x1;
constexpr std::uint32_t FormatLocation = 0x2;

// The user-mode sink: levels, prefix, console and debugger outputs. The file
// output is left to the platform sink below it.
class TraceRedirector : public Shared::Diagnostics::TraceRedirector {
public:
    TraceRedirector();
    ~TraceRedirector() override;
    TraceRedirector(const TraceRedirector&) = delete;
    TraceRedirector& operator=(const TraceRedirector&) = delete;

    void PrintW(unsigned level, const Shared::Diagnostics::TraceLocation& location, const wchar_t* format,
                va_list args) override;
    void PrintA(unsigned level, const Shared::Diagnostics::TraceLocation& location, const char* format,
                va_list args) override;

    virtual void RunLogRetention() = 0;
    virtual void SetFileOutput(bool enable) = 0;
    virtual bool IsFileOpen() const = 0;
    virtual void HoldFileOutput() = 0;
    virtual void ReleaseFileOutput() = 0;
    virtual void PrintHeader(std::uint32_t build) = 0;
    virtual void WriteToFile(const wchar_t* line) = 0;
    virtual void WriteToDebugger(const wchar_t* line) = 0;

    // Reads the sink's settings from its registry key; opens the log file and
    // writes the header when the file output is on.
    void Configure(const wchar_t* name, std::uint32_t build, std::uint32_t defaultLevelMask,
                   std::uint32_t defaultOutput, std::uint32_t defaultFormat);

    bool IsEnabled(unsigned level) const
    {
        return ((levelMask_ >> (level % 32)) & 1u) != 0 && (debugger_ || console_ || IsFileOpen());
    }

    const std::string& Name() const { return name_; }
    bool HasTimestamp() const { return timestamp_; }
    bool HasLocation() const { return location_; }

private:
    void EmitLine(const wchar_t* line);

    std::string name_;
    TraceFormatter<char> narrow_;
    TraceFormatter<wchar_t> wide_;
    std::uint32_t levelMask_ = 0;
    CRITICAL_SECTION printLock_;
    bool debugger_ = false;
    bool console_ = false;
    bool timestamp_ = false;
    bool location_ = false;
    std::wstring widened_;
    std::wstring fileLine_;
};

}  // namespace Kernel::UserMode::Diagnostics
