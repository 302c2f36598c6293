#include "kernel/win/framework/usermode/diagnostics/trace_redirector.h"

#include "kernel/win/framework/usermode/diagnostics/settings.h"

namespace Kernel::UserMode::Diagnostics {

namespace {

class PrintLock {
public:
    explicit PrintLock(CRITICAL_SECTION& section) : section_(section) { EnterCriticalSection(&section_); }
    ~PrintLock() { LeaveCriticalSection(&section_); }
    PrintLock(const PrintLock&) = delete;
    PrintLock& operator=(const PrintLock&) = delete;

private:
    CRITICAL_SECTION& section_;
};

// Standard output: a console gets the text as it is; a pipe or file gets UTF-8.
void WriteToConsole(const wchar_t* line)
{
    HANDLE output = GetStdHandle(STD_OUTPUT_HANDLE);
    if (output == nullptr || output == INVALID_HANDLE_VALUE) {
        return;
    }
    const int length = static_cast<int>(wcslen(line));
    DWORD mode = 0;
    DWORD written = 0;
    if (GetConsoleMode(output, &mode)) {
        WriteConsoleW(output, line, static_cast<DWORD>(length), &written, nullptr);
        return;
    }
    const int bytes = WideCharToMultiByte(CP_UTF8, 0, line, length, nullptr, 0, nullptr, nullptr);
    if (bytes <= 0) {
        return;
    }
    std::string text(static_cast<std::size_t>(bytes), '\0');
    WideCharToMultiByte(CP_UTF8, 0, line, length, &text[0], bytes, nullptr, nullptr);
    WriteFile(output, text.data(), static_cast<DWORD>(bytes), &written, nullptr);
}

}  // namespace

TraceRedirector::TraceRedirector() : narrow_(this), wide_(this)
{
    InitializeCriticalSection(&printLock_);
}

TraceRedirector::~TraceRedirector()
{
    DeleteCriticalSection(&printLock_);
}

void TraceRedirector::PrintW(unsigned, const Shared::Diagnostics::TraceLocation& location, const wchar_t* format,
                             va_list args)
{
    PrintLock lock(printLock_);
    EmitLine(wide_.Format(location, format, args));
}

void TraceRedirector::PrintA(unsigned, const Shared::Diagnostics::TraceLocation& location, const char* format,
                             va_list args)
{
    PrintLock lock(printLock_);
    const char* line = narrow_.Format(location, format, args);
    widened_.clear();
    for (; *line != '\0'; ++line) {
        widened_.push_back(static_cast<wchar_t>(static_cast<unsigned char>(*line)));
    }
    EmitLine(widened_.c_str());
}

void TraceRedirector::EmitLine(const wchar_t* line)
{
    if (line[0] == L'\0') {
        return;
    }
    if (console_) {
        WriteToConsole(line);
    }
    if (debugger_) {
        WriteToDebugger(line);
    }
    if (IsFileOpen()) {
        fileLine_.clear();
        for (const wchar_t* c = line; *c != L'\0'; ++c) {
            if (*c == L'\n') {
                fileLine_.push_back(L'\r');
            }
            fileLine_.push_back(*c);
        }
        WriteToFile(fileLine_.c_str());
    }
}

void TraceRedirector::Configure(const wchar_t* name, std::uint32_t build, std::uint32_t defaultLevelMask,
                                std::uint32_t defaultOutput, std::uint32_t defaultFormat)
{
    const std::wstring key = SettingsKey(name);

    name_.clear();
    for (const wchar_t* c = name; *c != L'\0'; ++c) {
        name_.push_back(static_cast<char>(*c & 0xFF));
    }

    levelMask_ = ReadDword(key.c_str(), L"TraceLevel", defaultLevelMask);

    const std::uint32_t output = ReadDword(key.c_str(), L"TraceOutput", defaultOutput);
    SetFileOutput((output & OutputFile) != 0);
    console_ = (output & OutputConsole) != 0;
    debugger_ = (output & OutputDebugger) != 0;

    const std::uint32_t format = ReadDword(key.c_str(), L"TraceFormat", defaultFormat);
    timestamp_ = (format & FormatTimestamp) != 0;
    location_ = (format & FormatLocation) != 0;

    if (build != 0) {
        PrintHeader(build);
    }
}

}  // namespace Kernel::UserMode::Diagnostics
