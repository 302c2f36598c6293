#pragma once

#include <atomic>
#include <cstdint>
#include <string>

namespace Common {

// Where an error was raised. The id is a constant unique per raising site.
struct ErrorSite {
    std::uint64_t id;
    const char* file;
    const char* function;
    std::uint32_t line;
};

constexpr std::uint64_t MakeErrorSiteId(const char* file, std::uint32_t line)
{
    std::uint64_t hash = 14695981039346656037ull;
    for (; *file != '\0'; ++file) {
        hash = (hash ^ static_cast<unsigned char>(*file)) * 1099511628211ull;
    }
    return (hash ^ line) * 1099511628211ull;
}

#define COMMON_ERROR_SITE(function) \
    (::Common::ErrorSite{::Common::MakeErrorSiteId(__FILE__, __LINE__), __FILE__, function, __LINE__})

struct ErrorRecord;

// Operations of one record type.
struct ErrorType {
    void (*destroy)(ErrorRecord* record);
    ErrorRecord* (*clone)(const ErrorRecord& record);
    std::wstring (*text)(const ErrorRecord& record);
    std::uint32_t (*number)(const ErrorRecord& record, const char* name);
    const char* (*module)(const ErrorRecord& record, const char* name);
    const wchar_t* (*string)(const ErrorRecord& record, const char* name);
    const char* (*names)(const ErrorRecord& record);
};

// Fixed part of a record block; the type's payload follows it in the same block.
struct ErrorRecord {
    std::atomic<std::uint32_t> references;
    std::uint32_t code;
    ErrorRecord* cause;
    const ErrorType* type;
    ErrorSite site;
    // Size of the whole block; a Windows error record keeps its result code here.
    std::uint32_t size;
};

// Reference-counted handle to an immutable chain of error records. An empty
// handle means success and has code 0. Also raised as an exception.
class Error {
public:
    Error() noexcept = default;
    Error(const Error& other) noexcept;
    Error(Error&& other) noexcept;
    Error& operator=(const Error& other) noexcept;
    Error& operator=(Error&& other) noexcept;
    ~Error();

    static Error Make(const ErrorSite& site, std::uint32_t code);
    static Error Make(const ErrorSite& site, std::uint32_t code, const wchar_t* message);
    static Error Make(const ErrorSite& site, std::uint32_t code, const wchar_t* message,
                      const wchar_t* path, const wchar_t* name);

    // The process-wide success value.
    static const Error& Success() noexcept;

    std::uint32_t Code() const noexcept;
    bool Failed() const noexcept { return Code() != 0; }

    std::wstring Text() const;
    std::uint32_t NumberParameter(const char* name) const;
    const char* ModuleParameter(const char* name) const;
    const wchar_t* StringParameter(const char* name) const;
    const char* ParameterNames() const;
    const ErrorSite* Site() const noexcept;

    // A handle to the next record of the chain (empty at the end).
    Error Cause() const noexcept;

    const ErrorRecord* Head() const noexcept { return head_; }

private:
    explicit Error(ErrorRecord* adopted) noexcept : head_(adopted) {}
    static Error Adopt(ErrorRecord* record) noexcept;

    friend Error& AddWindowsError(Error& error, std::uint32_t win32Code);

    ErrorRecord* head_ = nullptr;
};

// Attaches the Windows error (a positive Win32 code becomes its HRESULT form)
// as the cause of the head record, copying the head first when it is shared.
Error& AddWindowsError(Error& error, std::uint32_t win32Code);

}  // namespace Common
