// The real server binary under Wine: its command line, the log file it writes
// and the log retention it runs at exit.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <regex>

#include "tests/support/test_support.h"

using namespace TestSupport;
using ::testing::IsEmpty;
using ::testing::HasSubstr;
using ::testing::StartsWith;

namespace {

const wchar_t* kSettings = L"SOFTWARE\\Veltris\\VssRequestor";

// gtest's own regular expressions are the simple kind on Windows.
::testing::AssertionResult Matches(const std::wstring& text, const char* pattern)
{
    const std::string narrow(text.begin(), text.end());
    if (std::regex_match(narrow, std::regex(pattern))) {
        return ::testing::AssertionSuccess();
    }
    return ::testing::AssertionFailure() << '"' << narrow << "\" does not match " << pattern;
}

class ServerProcess : public ::testing::Test {
protected:
    ChildResult Start(const std::wstring& arguments)
    {
        return RunChild(BinaryPath(L"vss_requestor.exe"), arguments, {{L"ALLUSERSPROFILE", profile_.Path()}});
    }

    std::wstring LogFolder() const { return profile_.Path() + L"Veltris\\VssRequestorLogs\\"; }

    std::vector<std::wstring> LogFiles() const { return FindFiles(LogFolder(), L"VssRequestor*.log"); }

    // The records of the only log file, line ends removed.
    std::vector<std::wstring> Records()
    {
        const auto files = LogFiles();
        EXPECT_EQ(files.size(), 1u);
        return files.empty() ? std::vector<std::wstring>() : Lines(ReadUtf16(files[0]));
    }

    // The message of a record with the default prefix "[timestamp][VssRequestor][T] ".
    static std::wstring Message(const std::wstring& record)
    {
        const std::size_t at = record.find(L"[T] ");
        return at == std::wstring::npos ? record : record.substr(at + 4);
    }

    std::vector<std::wstring> Messages()
    {
        std::vector<std::wstring> messages;
        for (const auto& record : Records()) {
            messages.push_back(Message(record));
        }
        return messages;
    }

    TempFolder profile_;
    ScopedDword output_{kSettings, L"TraceOutput", 1};
};

TEST_F(ServerProcess, OnlyTheExactSwitchesAreAccepted)
{
    const struct {
        const wchar_t* arguments;
        DWORD exitCode;
    } cases[] = {
        {L"", 1},           {L"/regserver", 1},  {L"/REGSERVER", 1},  {L"RegServer", 1}, {L"--RegServer", 1},
        {L"/RegServer2", 1}, {L"-Embeddin", 1},  {L"/embedding", 1},  {L"x", 1},
        {L"/UnregServer", 0}, {L"-UnregServer extra words", 0},
        // Self-registration is not there yet: it must not claim success.
        {L"/RegServer", 1}, {L"-RegServer", 1},
    };
    for (const auto& c : cases) {
        EXPECT_EQ(Start(c.arguments).exitCode, c.exitCode) << "arguments: " << std::string(c.arguments, c.arguments + wcslen(c.arguments));
    }
}

TEST_F(ServerProcess, RejectedSwitchTracesOnlyTheTimeBanner)
{
    ASSERT_EQ(Start(L"/regserver").exitCode, 1u);
    const auto messages = Messages();
    ASSERT_EQ(messages.size(), 5u);  // three header records, banner, "End"
    EXPECT_TRUE(Matches(messages[3], "Time [0-9]{2}\\.[0-9]{2}\\.[0-9]{4} [0-9]{2}:[0-9]{2}:[0-9]{2} UTC"));
    EXPECT_EQ(messages[4], L"End");
}

TEST_F(ServerProcess, EmbeddingServesUntilIdleAndExitsWithZero)
{
    const ChildResult result = Start(L"-Embedding and further words");
    ASSERT_EQ(result.exitCode, 0u);
    const auto messages = Messages();
    ASSERT_GE(messages.size(), 3u);
    EXPECT_EQ(messages[messages.size() - 2], L"Exit code 0");
    EXPECT_EQ(messages[messages.size() - 1], L"End");
}

TEST_F(ServerProcess, LogFileIsUtf16WithHeaderAndCrLf)
{
    const ChildResult result = Start(L"/x");
    const auto files = LogFiles();
    ASSERT_EQ(files.size(), 1u);
    const std::wstring name = files[0].substr(LogFolder().size());
    EXPECT_TRUE(Matches(name, "VssRequestor-[0-9]{8}-[0-9]{6}-[0-9]{3}\\.log"));

    const auto bytes = ReadBytes(files[0]);
    ASSERT_GE(bytes.size(), 2u);
    EXPECT_EQ(bytes[0], 0xFF);
    EXPECT_EQ(bytes[1], 0xFE);

    const std::wstring text = ReadUtf16(files[0]);
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == L'\n') {
            ASSERT_TRUE(i > 0 && text[i - 1] == L'\r') << "bare LF at " << i;
        }
    }
    ASSERT_TRUE(!text.empty() && text.back() == L'\n');

    const auto messages = Messages();
    ASSERT_GE(messages.size(), 3u);
    const std::wstring header = L"build: 2769, process: " + std::to_wstring(result.processId) + L", '";
    EXPECT_THAT(messages[0], StartsWith(header));
    EXPECT_THAT(messages[0], HasSubstr(L"vss_requestor.exe'"));
    EXPECT_TRUE(Matches(messages[1], "[0-9]{4}\\.[0-9]{2}\\.[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2} UTC"));
    EXPECT_TRUE(Matches(messages[2], "[0-9]{4}\\.[0-9]{2}\\.[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2} LOCAL"));
}

TEST_F(ServerProcess, EachTraceFormatGivesItsPrefix)
{
    const char* expected[] = {
        "\\[VssRequestor\\]\\[T\\] End",
        "\\[[0-9]{8}-[0-9]{6}-[0-9]{3}\\]\\[VssRequestor\\]\\[T\\] End",
        "\\[VssRequestor\\]\\[T\\]\\[~TraceFrame\\(\\),trace_frame\\.cpp,[0-9]+\\] End",
        "\\[[0-9]{8}-[0-9]{6}-[0-9]{3}\\]\\[VssRequestor\\]\\[T\\]\\[~TraceFrame\\(\\),trace_frame\\.cpp,[0-9]+\\] End",
    };
    for (DWORD format = 0; format < 4; ++format) {
        ScopedDword setting(kSettings, L"TraceFormat", format);
        TempFolder profile;
        ASSERT_EQ(RunChild(BinaryPath(L"vss_requestor.exe"), L"/x", {{L"ALLUSERSPROFILE", profile.Path()}}).exitCode,
                  1u);
        const auto files = FindFiles(profile.Path() + L"Veltris\\VssRequestorLogs\\", L"*.log");
        ASSERT_EQ(files.size(), 1u);
        const auto records = Lines(ReadUtf16(files[0]));
        ASSERT_FALSE(records.empty());
        const std::wstring& last = records.back();
        EXPECT_TRUE(Matches(last, expected[format])) << "format " << format;
    }
}

TEST_F(ServerProcess, OutputBitsChooseFileAndConsole)
{
    {
        ScopedDword console(kSettings, L"TraceOutput", 2);
        const ChildResult result = Start(L"/x");
        EXPECT_TRUE(LogFiles().empty());
        // The console gets LF line ends and the whole of every record.
        EXPECT_THAT(result.output, HasSubstr("vss_requestor.exe'\n"));
        EXPECT_THAT(result.output, HasSubstr("[VssRequestor][T] End\n"));
        EXPECT_EQ(result.output.find('\r'), std::string::npos);
    }
    {
        ScopedDword none(kSettings, L"TraceOutput", 0);
        const ChildResult result = Start(L"/x");
        EXPECT_TRUE(LogFiles().empty());
        EXPECT_EQ(result.output, "");
    }
}

TEST_F(ServerProcess, LevelMaskAndTracingSwitch)
{
    {
        // Level 2 off: the file is made but receives no record.
        ScopedDword level(kSettings, L"TraceLevel", 3);
        Start(L"/x");
        EXPECT_THAT(Records(), IsEmpty());
        DeleteFileW(LogFiles()[0].c_str());
    }
    {
        ScopedDword off(L"SOFTWARE\\Veltris\\Tessera", L"VssRequestorTracing", 0);
        Start(L"/x");
        EXPECT_THAT(Records(), IsEmpty());
        DeleteFileW(LogFiles()[0].c_str());

        // An explicit level mask still switches tracing on.
        ScopedDword level(kSettings, L"TraceLevel", 4);
        Start(L"/x");
        EXPECT_EQ(Messages().size(), 5u);
        DeleteFileW(LogFiles()[0].c_str());
    }
    {
        // Level 34 tests bit 2.
        ScopedDword level(kSettings, L"TraceLevel", 0x80000004);
        Start(L"/x");
        EXPECT_EQ(Messages().size(), 5u);
    }
}

TEST_F(ServerProcess, RetentionAtExitSparesOwnFileAndOtherSinks)
{
    const std::wstring folder = LogFolder();
    CreateDirectoryW((profile_.Path() + L"Veltris").c_str(), nullptr);
    CreateDirectoryW(folder.c_str(), nullptr);
    for (const wchar_t* name : {L"VssRequestor-20000101-000000-000.log", L"OtherSink-20000101-000000-000.log"}) {
        HANDLE file = CreateFileW((folder + name).c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW, 0, nullptr);
        ASSERT_NE(file, INVALID_HANDLE_VALUE);
        CloseHandle(file);
    }
    ScopedDword days(kSettings, L"LogExpiredPeriodInDays", 0);
    Start(L"/x");

    const auto own = LogFiles();
    ASSERT_EQ(own.size(), 1u);  // the old one went, the running process's file stayed
    EXPECT_NE(own[0], folder + L"VssRequestor-20000101-000000-000.log");
    EXPECT_EQ(Messages().back(), L"End");
    EXPECT_EQ(FindFiles(folder, L"OtherSink*.log").size(), 1u);
}

}  // namespace
