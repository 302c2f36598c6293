// The trace sink in process: records written to a log file of a test sink.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "kernel/win/framework/usermode/diagnostics/trace.h"
#include "tests/support/test_support.h"

namespace {

using namespace Kernel::UserMode::Diagnostics;
using namespace TestSupport;
using ::testing::ElementsAre;

class TraceSink : public ::testing::Test {
protected:
    void SetUp() override
    {
        SetEnvironmentVariableW(L"ALLUSERSPROFILE", profile_.Path().c_str());
        // Format 0: "[name][T] message", nothing that changes from run to run.
        TraceRedirectorInstance().Configure(L"traceTest", 0, 7, OutputFile, 0);
    }

    void TearDown() override { TraceRedirectorInstance().SetFileOutput(false); }

    std::vector<std::wstring> Records()
    {
        const auto files = FindFiles(profile_.Path() + L"Veltris\\TraceTestLogs\\", L"traceTest-*.log");
        EXPECT_EQ(files.size(), 1u);
        return files.empty() ? std::vector<std::wstring>() : Lines(ReadUtf16(files[0]));
    }

    TempFolder profile_;
};

TEST_F(TraceSink, WideAndNarrowArgumentsPrintWhole)
{
    DIAG_TRACE(L"wide %s narrow %S number %Iu %I64d %hu\n", L"left-right", "up-down", static_cast<size_t>(42),
               static_cast<long long>(-5), static_cast<unsigned short>(7));
    DIAG_TRACE("narrow format %s\n", "text");
    EXPECT_THAT(Records(), ElementsAre(L"[traceTest][T] wide left-right narrow up-down number 42 -5 7",
                                       L"[traceTest][T] narrow format text"));
}

TEST_F(TraceSink, LongMessagesArriveWhole)
{
    const std::wstring wide(5000, L'w');
    const std::string narrow(9000, 'n');
    DIAG_TRACE(L"%s|%S\n", wide.c_str(), narrow.c_str());
    const std::string narrowOnly(3000, 'a');
    DIAG_TRACE("%s\n", narrowOnly.c_str());
    const auto records = Records();
    ASSERT_EQ(records.size(), 2u);
    EXPECT_EQ(records[0], L"[traceTest][T] " + wide + L"|" + std::wstring(narrow.begin(), narrow.end()));
    EXPECT_EQ(records[1], L"[traceTest][T] " + std::wstring(narrowOnly.begin(), narrowOnly.end()));
}

TEST_F(TraceSink, MultiLineMessageGetsCrLfInTheFile)
{
    DIAG_TRACE(L"one\ntwo\n");
    const auto files = FindFiles(profile_.Path() + L"Veltris\\TraceTestLogs\\", L"*.log");
    ASSERT_EQ(files.size(), 1u);
    EXPECT_EQ(ReadUtf16(files[0]), L"[traceTest][T] one\r\ntwo\r\n");
}

TEST_F(TraceSink, LevelsWrapAtThirtyTwo)
{
    EXPECT_TRUE(IsTraceEnabled(2));
    EXPECT_TRUE(IsTraceEnabled(34));
    EXPECT_FALSE(IsTraceEnabled(3));
    EXPECT_FALSE(IsTraceEnabled(35));
}

TEST_F(TraceSink, NoOutputMeansNothingIsEnabled)
{
    TraceRedirectorInstance().SetFileOutput(false);
    EXPECT_FALSE(IsTraceEnabled(2));
}

TEST_F(TraceSink, HeldLinesAreWrittenWhenReleased)
{
    auto& sink = TraceRedirectorInstance();
    sink.HoldFileOutput();
    DIAG_TRACE(L"held\n");
    EXPECT_TRUE(Records().empty());
    sink.ReleaseFileOutput();
    EXPECT_THAT(Records(), ElementsAre(L"[traceTest][T] held"));
}

TEST(TraceFolder, NoDriveMeansNoFile)
{
    SetEnvironmentVariableW(L"ALLUSERSPROFILE", L"\\\\server\\share");
    TraceRedirectorInstance().Configure(L"traceTest", 0, 7, OutputFile, 0);
    EXPECT_FALSE(TraceRedirectorInstance().IsFileOpen());
    EXPECT_EQ(Win32::LogFolder(L"traceTest"), L"\\\\server\\share\\Veltris\\TraceTestLogs\\");
}

}  // namespace
