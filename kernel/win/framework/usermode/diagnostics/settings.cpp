#include "kernel/win/framework/usermode/diagnostics/settings.h"

#include <windows.h>

namespace Kernel::UserMode::Diagnostics {

std::wstring SettingsKey(const wchar_t* name)
{
    return std::wstring(L"SOFTWARE\\") + L"Veltris" + L"\\" + name;
}

std::uint32_t ReadDword(const wchar_t* keyPath, const wchar_t* valueName, std::uint32_t defaultValue)
{
    HKEY key = nullptr;
    if (RegOpenKeyW(HKEY_LOCAL_MACHINE, keyPath, &key) != ERROR_SUCCESS) {
        return defaultValue;
    }
    DWORD value = 0;
    DWORD type = 0;
    DWORD size = sizeof(value);
    const LONG status = RegQueryValueExW(key, valueName, nullptr, &type, reinterpret_cast<BYTE*>(&value), &size);
    RegCloseKey(key);
    return status == ERROR_SUCCESS && type == REG_DWORD ? value : defaultValue;
}

}  // namespace Kernel::UserMode::Diagnostics
