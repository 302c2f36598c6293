#include "kernel/win/tessera/vss/requestor/server.h"

#include <objbase.h>

#include "kernel/win/framework/usermode/diagnostics/trace.h"
#include "kernel/win/tessera/vss/requestor/global_component_reference.h"

namespace Kernel::Tessera::Vss::Requestor {

namespace {

volatile LONG g_liveObjects = 0;
volatile LONG g_serverLocks = 0;

constexpr DWORD kIdlePollMilliseconds = 5000;

}  // namespace

GlobalComponentReference::GlobalComponentReference()
{
    InterlockedIncrement(&g_liveObjects);
}

GlobalComponentReference::~GlobalComponentReference()
{
    InterlockedDecrement(&g_liveObjects);
}

long GlobalComponentReference::LiveObjects()
{
    return InterlockedCompareExchange(&g_liveObjects, 0, 0);
}

void Server::Lock()
{
    InterlockedIncrement(&g_serverLocks);
}

void Server::Unlock()
{
    InterlockedDecrement(&g_serverLocks);
}

long Server::Locks()
{
    return InterlockedCompareExchange(&g_serverLocks, 0, 0);
}

bool Server::IsIdle()
{
    return Locks() == 0 && GlobalComponentReference::LiveObjects() == 0;
}

Server::~Server()
{
    CoUninitialize();
}

HRESULT Server::Initialize()
{
    HRESULT result = CoInitializeEx(nullptr, COINIT_MULTITHREADED);
    if (FAILED(result)) {
        DIAG_TRACE(L"CoInitializeEx failed, result 0x%X\n", result);
        return result;
    }
    result = CoInitializeSecurity(nullptr, -1, nullptr, nullptr, RPC_C_AUTHN_LEVEL_PKT_PRIVACY,
                                  RPC_C_IMP_LEVEL_IMPERSONATE, nullptr, EOAC_STATIC_CLOAKING, nullptr);
    if (result == RPC_E_TOO_LATE) {
        DIAG_TRACE(L"CoInitializeSecurity has been already called by CRT\n");
        return S_OK;
    }
    if (FAILED(result)) {
        DIAG_TRACE(L"CoInitializeSecurity failed, result 0x%X\n", result);
        return result;
    }
    return S_OK;
}

HRESULT Server::Run()
{
    try {
        // The class-object holders are made here in publication order (requestor,
        // snapshot enumerator, provider enumerator); leaving this scope revokes
        // them in reverse order, also when a registration throws.
        do {
            Sleep(kIdlePollMilliseconds);
        } while (!IsIdle());
    } catch (HRESULT result) {
        DIAG_TRACE(L"Exception code 0x%X\n", result);
        return result;
    }
    return S_OK;
}

}  // namespace Kernel::Tessera::Vss::Requestor
