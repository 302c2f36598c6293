#include "kernel/win/framework/usermode/diagnostics/win32/log_retention.h"

#include <algorithm>

#include "common/error.h"
#include "kernel/win/framework/usermode/diagnostics/settings.h"

namespace Kernel::UserMode::Diagnostics {

namespace {

constexpr std::uint64_t kDay = 864000000000ull;
constexpr std::uint64_t kMebibyte = 1048576ull;

std::uint64_t Combine(DWORD high, DWORD low)
{
    return (static_cast<std::uint64_t>(high) << 32) | low;
}

[[noreturn]] void Raise(const Common::ErrorSite& site, const wchar_t* message, DWORD win32Code)
{
    Common::Error error = Common::Error::Make(site, 1, message);
    throw Common::AddWindowsError(error, win32Code);
}

class FindHandle {
public:
    explicit FindHandle(HANDLE handle) : handle_(handle) {}
    ~FindHandle() { FindClose(handle_); }
    FindHandle(const FindHandle&) = delete;
    FindHandle& operator=(const FindHandle&) = delete;

private:
    HANDLE handle_;
};

}  // namespace

std::uint64_t ToFileTime(const SYSTEMTIME& time)
{
    FILETIME file;
    if (!SystemTimeToFileTime(&time, &file)) {
        Raise(COMMON_ERROR_SITE("Kernel::UserMode::Diagnostics::ToFileTime"), L"Failed to convert to FILETIME",
              GetLastError());
    }
    return Combine(file.dwHighDateTime, file.dwLowDateTime);
}

LogRetention::LogRetention(const std::wstring& settingsKey, std::wstring pattern, std::wstring folder)
    : folder_(std::move(folder)),
      pattern_(std::move(pattern)),
      expiryDays_(ReadDword(settingsKey.c_str(), L"LogExpiredPeriodInDays", 30)),
      sizeLimit_(ReadDword(settingsKey.c_str(), L"LogMaxSizeInMb", 10) * kMebibyte)
{
}

std::vector<LogRetention::File> LogRetention::GetFiles() const
{
    std::vector<File> files;
    WIN32_FIND_DATAW data;
    HANDLE search = FindFirstFileW((folder_ + pattern_).c_str(), &data);
    if (search == INVALID_HANDLE_VALUE) {
        const DWORD status = GetLastError();
        if (status == ERROR_FILE_NOT_FOUND || status == ERROR_PATH_NOT_FOUND) {
            return files;
        }
        Raise(COMMON_ERROR_SITE("Kernel::UserMode::Diagnostics::LogRetention::GetFiles"),
              L"Failed to acquire the log files", status);
    }
    FindHandle owner(search);
    do {
        files.push_back({folder_ + data.cFileName, Combine(data.nFileSizeHigh, data.nFileSizeLow),
                         Combine(data.ftCreationTime.dwHighDateTime, data.ftCreationTime.dwLowDateTime)});
    } while (FindNextFileW(search, &data));
    const DWORD status = GetLastError();
    if (status != ERROR_NO_MORE_FILES) {
        Raise(COMMON_ERROR_SITE("Kernel::UserMode::Diagnostics::LogRetention::GetFiles"),
              L"Continues the file search failed", status);
    }
    return files;
}

std::vector<std::wstring> LogRetention::Select(const std::vector<File>& files, std::uint64_t now) const
{
    std::vector<std::wstring> doomed;
    std::vector<File> remaining;
    for (const File& file : files) {
        // Files from the future never expire, but count for the size.
        if (file.created <= now && (now - file.created) / kDay >= expiryDays_) {
            doomed.push_back(file.path);
        } else {
            remaining.push_back(file);
        }
    }

    std::stable_sort(remaining.begin(), remaining.end(),
                     [](const File& a, const File& b) { return a.created < b.created; });
    std::uint64_t total = 0;
    auto newest = remaining.rbegin();
    for (; newest != remaining.rend(); ++newest) {
        total += newest->size;
        if (total >= sizeLimit_) {
            break;
        }
    }
    for (; newest != remaining.rend(); ++newest) {
        doomed.push_back(newest->path);
    }
    return doomed;
}

void LogRetention::Run()
{
    try {
        SYSTEMTIME utc;
        GetSystemTime(&utc);
        const std::uint64_t now = ToFileTime(utc);
        // Failed deletes are ignored: the running process's own file is one.
        for (const std::wstring& path : Select(GetFiles(), now)) {
            DeleteFileW(path.c_str());
        }
    } catch (const Common::Error&) {
        // A failed search or time conversion ends the run; nothing to report.
    }
}

}  // namespace Kernel::UserMode::Diagnostics
