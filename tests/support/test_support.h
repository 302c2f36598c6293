#pragma once

#include <windows.h>

#include <cstdint>
#include <string>
#include <utility>
#include <vector>

namespace TestSupport {

// A binary built beside the running test.
std::wstring BinaryPath(const wchar_t* name);

struct ChildResult {
    DWORD exitCode = 0xFFFFFFFF;
    DWORD processId = 0;
    std::string output;  // standard output, as written
};

// Runs a program to its end with extra environment variables and its standard
// output captured through a pipe.
ChildResult RunChild(const std::wstring& exe, const std::wstring& arguments,
                     const std::vector<std::pair<std::wstring, std::wstring>>& environment = {});

// A fresh folder removed with its contents at the end of the scope.
class TempFolder {
public:
    TempFolder();
    ~TempFolder();
    TempFolder(const TempFolder&) = delete;
    TempFolder& operator=(const TempFolder&) = delete;
    const std::wstring& Path() const { return path_; }  // with a trailing backslash

private:
    std::wstring path_;
};

// Sets a REG_DWORD under HKEY_LOCAL_MACHINE for the scope and puts back what was there.
class ScopedDword {
public:
    ScopedDword(const wchar_t* keyPath, const wchar_t* name, DWORD value);
    ~ScopedDword();
    ScopedDword(const ScopedDword&) = delete;
    ScopedDword& operator=(const ScopedDword&) = delete;

private:
    std::wstring key_;
    std::wstring name_;
    bool hadValue_ = false;
    DWORD type_ = 0;
    std::vector<BYTE> previous_;
};

// The files of a folder matching a pattern, as full paths.
std::vector<std::wstring> FindFiles(const std::wstring& folder, const wchar_t* pattern);

std::vector<unsigned char> ReadBytes(const std::wstring& path);

// A UTF-16LE file's text without its byte-order mark.
std::wstring ReadUtf16(const std::wstring& path);

// Text split at CR LF (or LF) line ends.
std::vector<std::wstring> Lines(const std::wstring& text);

}  // namespace TestSupport
