#include "kernel/win/framework/usermode/diagnostics/trace_formatter.h"

#include <windows.h>

#include <cstdio>

#include "kernel/win/framework/usermode/diagnostics/trace_redirector.h"

namespace Kernel::UserMode::Diagnostics {

namespace {

// Microsoft-convention printing: in the wide formats %s is a wide string and %S
// a narrow one.
template <typename CharT>
struct Text;

template <>
struct Text<char> {
    static constexpr const char* prefixes[4] = {
        "[%s][%s] %s",
        "[%04hu%02hu%02hu-%02hu%02hu%02hu-%03hu][%s][%s] %s",
        "[%s][%s][%s(),%s,%d] %s",
        "[%04hu%02hu%02hu-%02hu%02hu%02hu-%03hu][%s][%s][%s(),%s,%d] %s",
    };
    static int Print(char* buffer, std::size_t size, const char* format, va_list args)
    {
        return _vsnprintf(buffer, size, format, args);
    }
    static int Count(const char* format, va_list args) { return _vscprintf(format, args); }
};

template <>
struct Text<wchar_t> {
    static constexpr const wchar_t* prefixes[4] = {
        L"[%S][%S] %s",
        L"[%04hu%02hu%02hu-%02hu%02hu%02hu-%03hu][%S][%S] %s",
        L"[%S][%S][%S(),%S,%d] %s",
        L"[%04hu%02hu%02hu-%02hu%02hu%02hu-%03hu][%S][%S][%S(),%S,%d] %s",
    };
    static int Print(wchar_t* buffer, std::size_t size, const wchar_t* format, va_list args)
    {
        return _vsnwprintf(buffer, size, format, args);
    }
    static int Count(const wchar_t* format, va_list args) { return _vscwprintf(format, args); }
};

enum class Fit { Done, NoSpace, Failed };

// One bounded print. The runtime reports truncation either as -1 or as a count
// that leaves no room for the NUL; a second, counting pass tells lack of space
// from a bad format.
template <typename CharT>
Fit BoundedPrint(std::vector<CharT>& buffer, const CharT* format, va_list args)
{
    va_list copy;
    va_copy(copy, args);
    const int written = Text<CharT>::Print(buffer.data(), buffer.size(), format, copy);
    va_end(copy);
    if (written >= 0 && static_cast<std::size_t>(written) < buffer.size()) {
        return Fit::Done;
    }
    buffer.back() = CharT(0);
    va_copy(copy, args);
    const int needed = Text<CharT>::Count(format, copy);
    va_end(copy);
    return needed < 0 ? Fit::Failed : Fit::NoSpace;
}

template <typename CharT>
Fit PrintInto(std::vector<CharT>& buffer, const CharT* format, ...)
{
    va_list args;
    va_start(args, format);
    const Fit fit = BoundedPrint(buffer, format, args);
    va_end(args);
    return fit;
}

template <typename CharT>
void Reserve(std::vector<CharT>& buffer)
{
    if (buffer.empty()) {
        buffer.resize(1000);
    }
}

}  // namespace

template <typename CharT>
const CharT* TraceFormatter<CharT>::Format(const Shared::Diagnostics::TraceLocation& location, const CharT* format,
                                           va_list args)
{
    Reserve(prefix_);
    Reserve(message_);

    SYSTEMTIME t;
    GetSystemTime(&t);
    const int index = (owner_->HasTimestamp() ? 1 : 0) | (owner_->HasLocation() ? 2 : 0);
    const CharT* pattern = Text<CharT>::prefixes[index];
    const char* name = owner_->Name().c_str();

    auto printPrefix = [&]() {
        switch (index) {
        case 0:
            return PrintInto(prefix_, pattern, name, location.tag, format);
        case 1:
            return PrintInto(prefix_, pattern, t.wYear, t.wMonth, t.wDay, t.wHour, t.wMinute, t.wSecond,
                             t.wMilliseconds, name, location.tag, format);
        case 2:
            return PrintInto(prefix_, pattern, name, location.tag, location.function, location.file, location.line,
                             format);
        default:
            return PrintInto(prefix_, pattern, t.wYear, t.wMonth, t.wDay, t.wHour, t.wMinute, t.wSecond,
                             t.wMilliseconds, name, location.tag, location.function, location.file, location.line,
                             format);
        }
    };
    while (printPrefix() == Fit::NoSpace) {
        prefix_.resize(prefix_.size() * 2);
    }

    // The prefix carries the caller's format unexpanded; this pass expands it.
    while (BoundedPrint(message_, prefix_.data(), args) == Fit::NoSpace) {
        message_.resize(message_.size() * 2);
    }
    return message_.data();
}

template class TraceFormatter<char>;
template class TraceFormatter<wchar_t>;

}  // namespace Kernel::UserMode::Diagnostics
