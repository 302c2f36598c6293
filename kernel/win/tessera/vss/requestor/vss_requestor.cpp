#include "kernel/win/tessera/vss/requestor/vss_requestor.h"

#include <windows.h>

#include <cstdlib>
#include <cwchar>

#include "kernel/win/framework/usermode/diagnostics/trace.h"
#include "kernel/win/tessera/vss/requestor/registration.h"
#include "kernel/win/tessera/vss/requestor/server.h"
#include "kernel/win/tessera/vss/requestor/tracing_setup.h"

namespace Kernel::Tessera::Vss::Requestor {

namespace {

// A 32-bit build must not serve where the 64-bit executable belongs.
constexpr bool kIsRefusedBuild = sizeof(void*) == 4;

int RunServer()
{
    Server server;
    HRESULT status = server.Initialize();
    if (SUCCEEDED(status)) {
        status = server.Run();
    }
    const int exitCode = FAILED(status) ? 1 : 0;
    DIAG_TRACE(L"Exit code %u\n", exitCode);
    return exitCode;
}

}  // namespace

int Run(int argc, wchar_t** argv)
{
    InitTracing();

    SYSTEMTIME now;
    GetSystemTime(&now);
    DIAG_TRACE(L"Time %02hu.%02hu.%04hu %02hu:%02hu:%02hu UTC\n", now.wDay, now.wMonth, now.wYear, now.wHour,
               now.wMinute, now.wSecond);

    if (kIsRefusedBuild) {
        DIAG_TRACE(L"Unable to run 32-bit application, use 64-bit one\n");
        return 1;
    }
    if (argc < 2 || (argv[1][0] != L'-' && argv[1][0] != L'/')) {
        return 1;
    }
    const wchar_t* keyword = argv[1] + 1;
    if (std::wcscmp(keyword, L"RegServer") == 0) {
        return RegisterServer() ? 0 : 1;
    }
    if (std::wcscmp(keyword, L"UnregServer") == 0) {
        UnregisterServer();
        return 0;
    }
    if (std::wcscmp(keyword, L"Embedding") == 0) {
        return RunServer();
    }
    return 1;
}

}  // namespace Kernel::Tessera::Vss::Requestor

int WINAPI wWinMain(HINSTANCE, HINSTANCE, PWSTR, int)
{
    return Kernel::Tessera::Vss::Requestor::Run(__argc, __wargv);
}
