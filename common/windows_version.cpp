#include "common/windows_version.h"

#include <windows.h>

namespace Common::WindowsVersion {

namespace {

bool Verify(OSVERSIONINFOEXW& info, DWORD mask, DWORDLONG condition)
{
    info.dwOSVersionInfoSize = sizeof(info);
    return VerifyVersionInfoW(&info, mask, condition) != FALSE;
}

bool IsWorkstationType()
{
    OSVERSIONINFOEXW info = {};
    info.wProductType = VER_NT_WORKSTATION;
    return Verify(info, VER_PRODUCT_TYPE, VerSetConditionMask(0, VER_PRODUCT_TYPE, VER_EQUAL));
}

}  // namespace

bool IsServer()
{
    return !IsWorkstationType();
}

bool IsExactly(unsigned major, unsigned minor)
{
    OSVERSIONINFOEXW info = {};
    info.dwMajorVersion = major;
    info.dwMinorVersion = minor;
    DWORDLONG condition = VerSetConditionMask(0, VER_MAJORVERSION, VER_EQUAL);
    condition = VerSetConditionMask(condition, VER_MINORVERSION, VER_EQUAL);
    return Verify(info, VER_MAJORVERSION | VER_MINORVERSION, condition);
}

bool IsAtLeast(unsigned major, unsigned minor, unsigned servicePack)
{
    OSVERSIONINFOEXW info = {};
    info.dwMajorVersion = major;
    info.dwMinorVersion = minor;
    info.wServicePackMajor = static_cast<WORD>(servicePack);
    DWORDLONG condition = VerSetConditionMask(0, VER_MAJORVERSION, VER_GREATER_EQUAL);
    condition = VerSetConditionMask(condition, VER_MINORVERSION, VER_GREATER_EQUAL);
    condition = VerSetConditionMask(condition, VER_SERVICEPACKMAJOR, VER_GREATER_EQUAL);
    return Verify(info, VER_MAJORVERSION | VER_MINORVERSION | VER_SERVICEPACKMAJOR, condition);
}

bool IsWorkstation52()
{
    return IsExactly(5, 2) && IsWorkstationType();
}

}  // namespace Common::WindowsVersion
