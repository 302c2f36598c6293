#pragma once

// Operating-system version tests, all answered by VerifyVersionInfoW.
namespace Common::WindowsVersion {

// The product type is not workstation.
bool IsServer();

// The system is exactly major.minor.
bool IsExactly(unsigned major, unsigned minor);

// The system is at least major.minor with at least the given service pack.
bool IsAtLeast(unsigned major, unsigned minor, unsigned servicePack);

// Version 5.2 with product type workstation (Windows XP x64).
bool IsWorkstation52();

}  // namespace Common::WindowsVersion
