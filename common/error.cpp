#include "common/error.h"

#include <cstdlib>
#include <cstring>
#include <new>

#include <windows.h>

#include "common/build_identity.h"

namespace Common {

namespace {

constexpr std::uint32_t kWindowsErrorCode = 0xFFF0;
constexpr std::uint32_t kOutOfMemoryCode = 0xFFF2;

// Payload of the string-carrying types: offsets from the block start of each
// stored string, then the strings with their terminating NULs.
const std::uint32_t* Offsets(const ErrorRecord& record)
{
    return reinterpret_cast<const std::uint32_t*>(&record + 1);
}

const wchar_t* StoredString(const ErrorRecord& record, std::size_t index)
{
    return reinterpret_cast<const wchar_t*>(reinterpret_cast<const char*>(&record) +
                                            Offsets(record)[index]);
}

ErrorRecord* NewBlock(std::size_t size)
{
    void* block = std::malloc(size);
    return block ? static_cast<ErrorRecord*>(block) : nullptr;
}

void DestroyBlock(ErrorRecord* record)
{
    record->~ErrorRecord();
    std::free(record);
}

std::size_t BlockSize(const ErrorRecord& record);

ErrorRecord* CloneBlock(const ErrorRecord& record)
{
    const std::size_t size = BlockSize(record);
    ErrorRecord* copy = NewBlock(size);
    if (!copy) {
        return nullptr;
    }
    std::memcpy(static_cast<void*>(copy), &record, size);
    new (&copy->references) std::atomic<std::uint32_t>(1);
    copy->cause = nullptr;
    return copy;
}

const char* ModuleOf(const ErrorRecord&, const char* name)
{
    return name && std::strcmp(name, "$module") == 0 ? VSS_REQUESTOR_MODULE_TAG : nullptr;
}

std::uint32_t NoNumber(const ErrorRecord&, const char*)
{
    return 0;
}

const wchar_t* NoString(const ErrorRecord&, const char*)
{
    return nullptr;
}

std::wstring NoText(const ErrorRecord&)
{
    return std::wstring();
}

std::wstring MessageText(const ErrorRecord& record)
{
    return StoredString(record, 0);
}

const wchar_t* PathAndName(const ErrorRecord& record, const char* name)
{
    if (!name) {
        return nullptr;
    }
    if (std::strcmp(name, "path") == 0) {
        return StoredString(record, 1);
    }
    if (std::strcmp(name, "name") == 0) {
        return StoredString(record, 2);
    }
    return nullptr;
}

const char* ModuleOnlyNames(const ErrorRecord&)
{
    return "$module";
}

const char* PathAndNameNames(const ErrorRecord&)
{
    return "path,name,$module";
}

std::wstring WindowsText(const ErrorRecord& record)
{
    DWORD result = record.size;
    DWORD flags = FORMAT_MESSAGE_ALLOCATE_BUFFER | FORMAT_MESSAGE_IGNORE_INSERTS | FORMAT_MESSAGE_FROM_SYSTEM;
    HMODULE source = nullptr;
    if (result & 0x10000000) {
        result &= ~0x10000000u;
        // Inserts are ignored here too: the record has no arguments to offer.
        flags |= FORMAT_MESSAGE_FROM_HMODULE;
        source = GetModuleHandleW(L"NTDLL.DLL");
    }
    wchar_t* buffer = nullptr;
    const DWORD length = FormatMessageW(flags, source, result, MAKELANGID(LANG_NEUTRAL, SUBLANG_SYS_DEFAULT),
                                        reinterpret_cast<wchar_t*>(&buffer), 0, nullptr);
    std::wstring text;
    if (length != 0 && buffer) {
        for (DWORD i = 0; i < length; ++i) {
            if (buffer[i] != L'\r') {
                text.push_back(buffer[i]);
            }
        }
    }
    LocalFree(buffer);
    if (!text.empty() && text.back() == L'\n') {
        text.pop_back();
    }
    if (text.find(L'\n') == std::wstring::npos && !text.empty() && text.back() == L'.') {
        text.pop_back();
    }
    return text;
}

std::uint32_t WindowsNumber(const ErrorRecord& record, const char* name)
{
    return name && std::strcmp(name, "code") == 0 ? record.size : 0;
}

const char* WindowsNames(const ErrorRecord&)
{
    return "code,$module";
}

const ErrorType kCodeOnlyType = {DestroyBlock, CloneBlock, NoText, NoNumber, ModuleOf, NoString, ModuleOnlyNames};
const ErrorType kMessageType = {DestroyBlock, CloneBlock, MessageText, NoNumber, ModuleOf, NoString, ModuleOnlyNames};
const ErrorType kPathAndNameType = {DestroyBlock, CloneBlock, MessageText, NoNumber, ModuleOf, PathAndName,
                                    PathAndNameNames};
const ErrorType kWindowsType = {DestroyBlock, CloneBlock, WindowsText, WindowsNumber, ModuleOf, NoString, WindowsNames};

std::size_t BlockSize(const ErrorRecord& record)
{
    return record.type == &kWindowsType ? sizeof(ErrorRecord) : record.size;
}

// Starts with one reference of its own, so handles never bring it to zero.
ErrorRecord g_outOfMemory = {{1}, kOutOfMemoryCode, nullptr, &kCodeOnlyType, {0, "", "", 0}, sizeof(ErrorRecord)};

ErrorRecord* OutOfMemory()
{
    g_outOfMemory.references.fetch_add(1);
    return &g_outOfMemory;
}

ErrorRecord* NewRecord(const ErrorSite& site, std::uint32_t code, const ErrorType* type,
                       const wchar_t* const* strings, std::size_t count)
{
    std::size_t size = sizeof(ErrorRecord) + count * sizeof(std::uint32_t);
    size = (size + alignof(wchar_t) - 1) / alignof(wchar_t) * alignof(wchar_t);
    std::size_t lengths[3] = {};
    for (std::size_t i = 0; i < count; ++i) {
        lengths[i] = std::wcslen(strings[i] ? strings[i] : L"") + 1;
    }
    std::size_t total = size;
    for (std::size_t i = 0; i < count; ++i) {
        total += lengths[i] * sizeof(wchar_t);
    }

    ErrorRecord* record = NewBlock(total);
    if (!record) {
        return OutOfMemory();
    }
    new (record) ErrorRecord{{1}, code, nullptr, type, site, static_cast<std::uint32_t>(total)};
    auto* offsets = reinterpret_cast<std::uint32_t*>(record + 1);
    std::size_t at = size;
    for (std::size_t i = 0; i < count; ++i) {
        offsets[i] = static_cast<std::uint32_t>(at);
        std::memcpy(reinterpret_cast<char*>(record) + at, strings[i] ? strings[i] : L"", lengths[i] * sizeof(wchar_t));
        at += lengths[i] * sizeof(wchar_t);
    }
    return record;
}

void Release(ErrorRecord* record)
{
    while (record && record->references.fetch_sub(1) == 1) {
        ErrorRecord* cause = record->cause;
        record->type->destroy(record);
        record = cause;
    }
}

void AddReference(ErrorRecord* record)
{
    if (record) {
        record->references.fetch_add(1);
    }
}

}  // namespace

Error::Error(const Error& other) noexcept : head_(other.head_)
{
    AddReference(head_);
}

Error::Error(Error&& other) noexcept : head_(other.head_)
{
    other.head_ = nullptr;
}

Error& Error::operator=(const Error& other) noexcept
{
    if (this != &other) {
        AddReference(other.head_);
        Release(head_);
        head_ = other.head_;
    }
    return *this;
}

Error& Error::operator=(Error&& other) noexcept
{
    if (this != &other) {
        Release(head_);
        head_ = other.head_;
        other.head_ = nullptr;
    }
    return *this;
}

Error::~Error()
{
    Release(head_);
}

Error Error::Adopt(ErrorRecord* record) noexcept
{
    return Error(record);
}

Error Error::Make(const ErrorSite& site, std::uint32_t code)
{
    return code == 0 ? Error() : Adopt(NewRecord(site, code, &kCodeOnlyType, nullptr, 0));
}

Error Error::Make(const ErrorSite& site, std::uint32_t code, const wchar_t* message)
{
    const wchar_t* strings[] = {message};
    return code == 0 ? Error() : Adopt(NewRecord(site, code, &kMessageType, strings, 1));
}

Error Error::Make(const ErrorSite& site, std::uint32_t code, const wchar_t* message, const wchar_t* path,
                  const wchar_t* name)
{
    const wchar_t* strings[] = {message, path, name};
    return code == 0 ? Error() : Adopt(NewRecord(site, code, &kPathAndNameType, strings, 3));
}

const Error& Error::Success() noexcept
{
    static const Error success;
    return success;
}

std::uint32_t Error::Code() const noexcept
{
    return head_ ? head_->code : 0;
}

std::wstring Error::Text() const
{
    return head_ ? head_->type->text(*head_) : std::wstring();
}

std::uint32_t Error::NumberParameter(const char* name) const
{
    return head_ ? head_->type->number(*head_, name) : 0;
}

const char* Error::ModuleParameter(const char* name) const
{
    return head_ ? head_->type->module(*head_, name) : nullptr;
}

const wchar_t* Error::StringParameter(const char* name) const
{
    return head_ ? head_->type->string(*head_, name) : nullptr;
}

const char* Error::ParameterNames() const
{
    return head_ ? head_->type->names(*head_) : "";
}

const ErrorSite* Error::Site() const noexcept
{
    return head_ ? &head_->site : nullptr;
}

Error Error::Cause() const noexcept
{
    if (!head_ || !head_->cause) {
        return Error();
    }
    AddReference(head_->cause);
    return Error(head_->cause);
}

Error& AddWindowsError(Error& error, std::uint32_t win32Code)
{
    const std::uint32_t result =
        static_cast<std::int32_t>(win32Code) > 0 ? (0x80070000u | (win32Code & 0xFFFF)) : win32Code;

    ErrorRecord* windows = NewBlock(sizeof(ErrorRecord));
    if (windows) {
        const ErrorSite site = COMMON_ERROR_SITE("Common::Error::AddWindowsError");
        new (windows) ErrorRecord{{1}, kWindowsErrorCode, nullptr, &kWindowsType, site, result};
    } else {
        windows = OutOfMemory();
    }

    ErrorRecord* head = error.head_;
    if (!head) {
        error.head_ = windows;
        return error;
    }
    if (head->references.load() != 1) {
        // Shared with other handles: they keep the chain they hold.
        ErrorRecord* copy = head->type->clone(*head);
        if (!copy) {
            Release(windows);
            return error;
        }
        Release(head);
        error.head_ = head = copy;
    }
    Release(head->cause);
    head->cause = windows;
    return error;
}

}  // namespace Common
