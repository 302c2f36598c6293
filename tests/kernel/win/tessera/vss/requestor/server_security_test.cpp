// Server::Initialize against a CoInitializeSecurity that answers as Windows does
// when the process security was already set (Wine answers S_OK instead).
#include <gtest/gtest.h>

#include <objbase.h>

#include "kernel/win/framework/usermode/diagnostics/trace.h"
#include "kernel/win/tessera/vss/requestor/server.h"
#include "tests/support/test_support.h"

namespace {

HRESULT g_securityResult = S_OK;
int g_securityCalls = 0;
DWORD g_capabilities = 0;
DWORD g_authenticationLevel = 0;

HRESULT WINAPI FakeCoInitializeSecurity(PSECURITY_DESCRIPTOR, LONG, SOLE_AUTHENTICATION_SERVICE*, void*,
                                        DWORD authenticationLevel, DWORD, void*, DWORD capabilities, void*)
{
    ++g_securityCalls;
    g_authenticationLevel = authenticationLevel;
    g_capabilities = capabilities;
    return g_securityResult;
}

}  // namespace

// Link-time seam: the import slot that the server's call goes through.
extern "C" {
decltype(&FakeCoInitializeSecurity) __imp_CoInitializeSecurity = FakeCoInitializeSecurity;
}

namespace {

using Kernel::Tessera::Vss::Requestor::Server;
using namespace TestSupport;

class ServerSecurity : public ::testing::Test {
protected:
    static void SetUpTestSuite()
    {
        // The trace goes to a log file of this test's own sink.
        SetEnvironmentVariableW(L"ALLUSERSPROFILE", Profile().Path().c_str());
        ScopedDword output(L"SOFTWARE\\Veltris\\ServerSecurityTest", L"TraceOutput", 1);
        Kernel::UserMode::Diagnostics::TraceRedirectorInstance().Configure(L"ServerSecurityTest", 0, 7, 1, 0);
    }

    static TempFolder& Profile()
    {
        static TempFolder folder;
        return folder;
    }

    static std::wstring Log()
    {
        const auto files = FindFiles(Profile().Path() + L"Veltris\\ServerSecurityTestLogs\\", L"*.log");
        return files.size() == 1 ? ReadUtf16(files[0]) : std::wstring();
    }
};

TEST_F(ServerSecurity, TooLateContinuesWithTheEarlierSecurity)
{
    g_securityResult = RPC_E_TOO_LATE;
    {
        Server server;
        EXPECT_EQ(server.Initialize(), S_OK);
    }
    EXPECT_EQ(g_authenticationLevel, static_cast<DWORD>(RPC_C_AUTHN_LEVEL_PKT_PRIVACY));
    EXPECT_EQ(g_capabilities, static_cast<DWORD>(EOAC_STATIC_CLOAKING));
    EXPECT_NE(Log().find(L"CoInitializeSecurity has been already called by CRT\r\n"), std::wstring::npos);
}

TEST_F(ServerSecurity, OtherFailureIsReturnedAndTraced)
{
    g_securityResult = E_ACCESSDENIED;
    Server server;
    EXPECT_EQ(server.Initialize(), E_ACCESSDENIED);
    EXPECT_NE(Log().find(L"CoInitializeSecurity failed, result 0x80070005\r\n"), std::wstring::npos);
}

TEST_F(ServerSecurity, IdleOnlyWithoutObjectsAndLocks)
{
    EXPECT_TRUE(Server::IsIdle());
    Server::Lock();
    EXPECT_FALSE(Server::IsIdle());
    Server::Unlock();
    EXPECT_TRUE(Server::IsIdle());
}

}  // namespace
