#pragma once

#include <cstdint>
#include <string>

namespace Kernel::UserMode::Diagnostics {

// "SOFTWARE\Veltris\<name>", the settings key of a component under HKEY_LOCAL_MACHINE.
std::wstring SettingsKey(const wchar_t* name);

// A REG_DWORD of HKEY_LOCAL_MACHINE\<keyPath>; the default when the key cannot be
// opened, the value is missing or it has another type.
std::uint32_t ReadDword(const wchar_t* keyPath, const wchar_t* valueName, std::uint32_t defaultValue);

}  // namespace Kernel::UserMode::Diagnostics
