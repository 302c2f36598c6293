#include "kernel/win/framework/usermode/diagnostics/trace.h"

#include <cstdarg>

namespace Kernel::UserMode::Diagnostics {

namespace {

// The text after the last '/', '\\' or ':'.
const char* ShortName(const char* name)
{
    if (!name) {
        return "";
    }
    const char* start = name;
    for (const char* c = name; *c != '\0'; ++c) {
        if (*c == '/' || *c == '\\' || *c == ':') {
            start = c + 1;
        }
    }
    return start;
}

Shared::Diagnostics::TraceLocation LocationOf(const TraceSite& site)
{
    return {site.tag, ShortName(site.file), ShortName(site.function), static_cast<int>(site.line)};
}

}  // namespace

Win32::TraceRedirector& TraceRedirectorInstance()
{
    static Win32::TraceRedirector instance;
    return instance;
}

void Print(const TraceSite& site, const wchar_t* format, ...)
{
    va_list args;
    va_start(args, format);
    site.sink->PrintW(site.level, LocationOf(site), format, args);
    va_end(args);
}

void Print(const TraceSite& site, const char* format, ...)
{
    va_list args;
    va_start(args, format);
    site.sink->PrintA(site.level, LocationOf(site), format, args);
    va_end(args);
}

}  // namespace Kernel::UserMode::Diagnostics
