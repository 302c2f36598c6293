#pragma once

#include <windows.h>

#include <cstdint>
#include <deque>
#include <string>

#include "kernel/win/framework/usermode/diagnostics/trace_redirector.h"

namespace Kernel::UserMode::Diagnostics::Win32 {

// "%ALLUSERSPROFILE%\Veltris\<Name>Logs\" (under "\Application Data" before
// version 6.0); empty when the profile variable cannot be expanded.
std::wstring LogFolder(const std::wstring& name);

// The concrete sink: a new UTF-16 log file per process start, the debugger
// output, and log retention at exit.
class TraceRedirector final : public UserMode::Diagnostics::TraceRedirector {
public:
    TraceRedirector();
    ~TraceRedirector() override;

    void RunLogRetention() override;
    void SetFileOutput(bool enable) override;
    bool IsFileOpen() const override { return file_ != nullptr; }
    void HoldFileOutput() override;
    void ReleaseFileOutput() override;
    void PrintHeader(std::uint32_t build) override;
    void WriteToFile(const wchar_t* line) override;
    void WriteToDebugger(const wchar_t* line) override;

private:
    std::wstring WideName() const;
    void OpenFile();
    void CloseFile();
    void WriteHeldLines();
    void Write(const void* data, DWORD bytes);

    CRITICAL_SECTION fileLock_;
    std::deque<std::wstring> held_;
    HANDLE file_ = nullptr;
    std::uint32_t holdCount_ = 0;
};

}  // namespace Kernel::UserMode::Diagnostics::Win32
