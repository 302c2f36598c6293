#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <vector>

namespace Kernel::UserMode::Diagnostics {

// 100-nanosecond units; raises Common::Error when the conversion fails.
std::uint64_t ToFileTime(const SYSTEMTIME& time);

// Keeps a sink's log folder within an age and a size budget.
class LogRetention {
public:
    struct File {
        std::wstring path;
        std::uint64_t size;
        std::uint64_t created;
    };

    // settingsKey: the sink's key under HKEY_LOCAL_MACHINE; pattern: "<name>*.log";
    // folder: with its trailing backslash.
    LogRetention(const std::wstring& settingsKey, std::wstring pattern, std::wstring folder);

    // Deletes expired files, then the oldest beyond the size limit. Never raises.
    void Run();

    // The folder's matching files in search order; raises Common::Error.
    std::vector<File> GetFiles() const;

    // The paths to delete, in deletion order: the expired files in list order,
    // then those beyond the size limit, newest first.
    std::vector<std::wstring> Select(const std::vector<File>& files, std::uint64_t now) const;

private:
    std::wstring folder_;
    std::wstring pattern_;
    std::uint32_t expiryDays_;
    std::uint64_t sizeLimit_;
};

}  // namespace Kernel::UserMode::Diagnostics
