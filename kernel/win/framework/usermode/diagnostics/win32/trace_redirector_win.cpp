#include "kernel/win/framework/usermode/diagnostics/win32/trace_redirector_win.h"

#include <cstdio>
#include <vector>

#include "common/windows_version.h"
#include "kernel/win/framework/usermode/diagnostics/settings.h"
#include "kernel/win/framework/usermode/diagnostics/trace.h"
#include "kernel/win/framework/usermode/diagnostics/win32/log_retention.h"

namespace Kernel::UserMode::Diagnostics::Win32 {

namespace {

class FileLock {
public:
    explicit FileLock(CRITICAL_SECTION& section) : section_(section) { EnterCriticalSection(&section_); }
    ~FileLock() { LeaveCriticalSection(&section_); }
    FileLock(const FileLock&) = delete;
    FileLock& operator=(const FileLock&) = delete;

private:
    CRITICAL_SECTION& section_;
};

std::wstring ExpandProfileFolder()
{
    const wchar_t* pattern = L"%ALLUSERSPROFILE%\\Veltris\\";
    std::vector<wchar_t> buffer(260);
    DWORD needed = ExpandEnvironmentStringsW(pattern, buffer.data(), static_cast<DWORD>(buffer.size()));
    if (needed > buffer.size()) {
        buffer.resize(needed);
        needed = ExpandEnvironmentStringsW(pattern, buffer.data(), static_cast<DWORD>(buffer.size()));
    }
    if (needed == 0 || needed > buffer.size()) {
        return std::wstring();
    }
    return buffer.data();
}

// Creates every folder of the chain; the first component must be a drive.
bool CreateFolderChain(const std::wstring& path)
{
    std::vector<std::wstring> parts;
    std::wstring part;
    for (wchar_t c : path) {
        if (c == L'\\' || c == L'/') {
            if (!part.empty()) {
                parts.push_back(part);
            }
            part.clear();
        } else {
            part.push_back(c);
        }
    }
    if (!part.empty()) {
        parts.push_back(part);
    }
    if (parts.empty() || parts[0].size() != 2 || parts[0][1] != L':') {
        return false;
    }
    std::wstring current = parts[0];
    for (std::size_t i = 1; i < parts.size(); ++i) {
        current += L'\\';
        current += parts[i];
        if (!CreateDirectoryW(current.c_str(), nullptr) && GetLastError() != ERROR_ALREADY_EXISTS) {
            return false;
        }
    }
    return true;
}

}  // namespace

std::wstring LogFolder(const std::wstring& name)
{
    std::wstring folder = ExpandProfileFolder();
    if (folder.empty()) {
        return folder;
    }
    std::wstring sink = name;
    if (!sink.empty() && sink[0] >= L'a' && sink[0] <= L'z') {
        sink[0] = static_cast<wchar_t>(sink[0] - L'a' + L'A');
    }
    folder += sink + L"Logs\\";
    if (!Common::WindowsVersion::IsAtLeast(6, 0, 0) && folder.find(L"\\Application Data") == std::wstring::npos) {
        const std::size_t at = folder.find(L"\\Veltris");
        if (at != std::wstring::npos) {
            folder.insert(at, L"\\Application Data");
        }
    }
    return folder;
}

TraceRedirector::TraceRedirector()
{
    InitializeCriticalSection(&fileLock_);
}

TraceRedirector::~TraceRedirector()
{
    CloseFile();
    DeleteCriticalSection(&fileLock_);
}

std::wstring TraceRedirector::WideName() const
{
    const std::string& name = Name();
    return std::wstring(name.begin(), name.end());
}

void TraceRedirector::RunLogRetention()
{
    const std::wstring name = WideName();
    const std::wstring folder = LogFolder(name);
    // Without a folder the pattern would be searched in the current directory.
    if (folder.empty()) {
        return;
    }
    LogRetention(SettingsKey(name.c_str()), name + L"*.log", folder).Run();
}

void TraceRedirector::SetFileOutput(bool enable)
{
    FileLock lock(fileLock_);
    CloseFile();
    if (enable) {
        OpenFile();
    }
}

void TraceRedirector::HoldFileOutput()
{
    FileLock lock(fileLock_);
    ++holdCount_;
}

void TraceRedirector::ReleaseFileOutput()
{
    FileLock lock(fileLock_);
    if (holdCount_ == 0) {
        return;
    }
    if (--holdCount_ == 0) {
        WriteHeldLines();
    }
}

void TraceRedirector::PrintHeader(std::uint32_t build)
{
    wchar_t image[260];
    if (GetModuleFileNameW(nullptr, image, 260) == 0) {
        image[0] = L'\0';
    }
    DIAG_TRACE(L"build: %u, process: %u, '%s'\n", build, GetCurrentProcessId(), image);

    SYSTEMTIME utc;
    GetSystemTime(&utc);
    DIAG_TRACE(L"%04hu.%02hu.%02hu %02hu:%02hu:%02hu UTC\n", utc.wYear, utc.wMonth, utc.wDay, utc.wHour, utc.wMinute,
               utc.wSecond);
    SYSTEMTIME local;
    if (SystemTimeToTzSpecificLocalTime(nullptr, &utc, &local)) {
        DIAG_TRACE(L"%04hu.%02hu.%02hu %02hu:%02hu:%02hu LOCAL\n", local.wYear, local.wMonth, local.wDay, local.wHour,
                   local.wMinute, local.wSecond);
    }
}

void TraceRedirector::WriteToFile(const wchar_t* line)
{
    if (holdCount_ != 0) {
        held_.emplace_back(line);
        return;
    }
    Write(line, static_cast<DWORD>(wcslen(line) * sizeof(wchar_t)));
}

void TraceRedirector::WriteToDebugger(const wchar_t* line)
{
    OutputDebugStringW(line);
}

void TraceRedirector::OpenFile()
{
    const std::wstring folder = LogFolder(WideName());
    if (folder.empty() || !CreateFolderChain(folder)) {
        return;
    }
    SYSTEMTIME t;
    GetSystemTime(&t);
    wchar_t path[261];
    const int length = _snwprintf(path, 260, L"%s%s-%04hu%02hu%02hu-%02hu%02hu%02hu-%03hu.log", folder.c_str(),
                                  WideName().c_str(), t.wYear, t.wMonth, t.wDay, t.wHour, t.wMinute, t.wSecond,
                                  t.wMilliseconds);
    if (length < 0 || length >= 260) {
        return;
    }
    path[length] = L'\0';

    HANDLE file = CreateFileW(path, GENERIC_READ | GENERIC_WRITE, FILE_SHARE_READ, nullptr, CREATE_NEW,
                              FILE_ATTRIBUTE_NORMAL, nullptr);
    if (file == INVALID_HANDLE_VALUE) {
        const std::wstring message =
            std::wstring(L"Creation new file: ") + path + L" , error: " + std::to_wstring(GetLastError());
        OutputDebugStringW(message.c_str());
        return;
    }
    static const unsigned char mark[2] = {0xFF, 0xFE};
    DWORD written = 0;
    if (!WriteFile(file, mark, sizeof(mark), &written, nullptr) || written != sizeof(mark)) {
        CloseHandle(file);
        OutputDebugStringW(L"Can't append byte order mark");
        return;
    }
    file_ = file;
}

void TraceRedirector::CloseFile()
{
    if (!file_) {
        return;
    }
    WriteHeldLines();
    CloseHandle(file_);
    file_ = nullptr;
}

void TraceRedirector::WriteHeldLines()
{
    while (!held_.empty()) {
        if (file_) {
            const std::wstring& line = held_.front();
            Write(line.c_str(), static_cast<DWORD>(line.size() * sizeof(wchar_t)));
        }
        held_.pop_front();
    }
}

void TraceRedirector::Write(const void* data, DWORD bytes)
{
    DWORD written = 0;
    if (!WriteFile(file_, data, bytes, &written, nullptr)) {
        const std::wstring message = L"Write operation failed, error: " + std::to_wstring(GetLastError());
        OutputDebugStringW(message.c_str());
    } else if (written != bytes) {
        const std::wstring message = L"Write operation failed, error: " + std::to_wstring(written) +
                                     L"(written bytes) != " + std::to_wstring(bytes) + L"(bytes to write)";
        OutputDebugStringW(message.c_str());
    }
}

}  // namespace Kernel::UserMode::Diagnostics::Win32
