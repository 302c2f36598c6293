// Log retention over a folder of files with chosen creation times and sizes.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "common/error.h"
#include "kernel/win/framework/usermode/diagnostics/win32/log_retention.h"
#include "tests/support/test_support.h"

namespace {

using Kernel::UserMode::Diagnostics::LogRetention;
using Kernel::UserMode::Diagnostics::ToFileTime;
using namespace TestSupport;
using ::testing::ElementsAre;
using ::testing::UnorderedElementsAre;

const wchar_t* kKey = L"SOFTWARE\\Veltris\\RetentionTest";
constexpr std::uint64_t kDay = 864000000000ull;
constexpr std::uint64_t kHour = kDay / 24;
constexpr std::uint64_t kMiB = 1048576ull;

// Wine cannot give a file a chosen creation time, so the selection is checked
// on file records and the folder walk on real files.
std::vector<std::wstring> Select(std::vector<LogRetention::File> files, std::uint64_t now)
{
    return LogRetention(kKey, L"Sink*.log", L"C:\\unused\\").Select(files, now);
}

constexpr std::uint64_t kNow = 130000000000000000ull;

TEST(RetentionSelection, ExpiresFilesOfAtLeastThePeriod)
{
    ScopedDword days(kKey, L"LogExpiredPeriodInDays", 3);
    EXPECT_THAT(Select({{L"exact", 0, kNow - 3 * kDay},
                        {L"older", 0, kNow - 40 * kDay},
                        {L"younger", 0, kNow - 3 * kDay + 1},
                        {L"future", 0, kNow + 5 * kDay}},
                       kNow),
                ElementsAre(L"exact", L"older"));
}

TEST(RetentionSelection, SizeBudgetKeepsTheNewest)
{
    const std::vector<LogRetention::File> files = {
        {L"middle", 4 * kMiB, kNow - 2 * kHour},
        {L"newest", 4 * kMiB, kNow - 1 * kHour},
        {L"oldest", 4 * kMiB, kNow - 3 * kHour},
    };
    {
        ScopedDword size(kKey, L"LogMaxSizeInMb", 10);
        EXPECT_THAT(Select(files, kNow), ElementsAre(L"oldest"));
    }
    {
        // The second newest brings the total to the limit and goes too.
        ScopedDword size(kKey, L"LogMaxSizeInMb", 8);
        EXPECT_THAT(Select(files, kNow), ElementsAre(L"middle", L"oldest"));
    }
}

TEST(RetentionSelection, FutureFilesCountForTheSize)
{
    ScopedDword size(kKey, L"LogMaxSizeInMb", 5);
    EXPECT_THAT(Select({{L"old", 2 * kMiB, kNow - kHour}, {L"future", 4 * kMiB, kNow + kDay}}, kNow),
                ElementsAre(L"old"));
}

TEST(RetentionSelection, LargeLimitDoesNotWrap)
{
    // 4096 MiB wrapped to 32 bits would be 0 and delete everything.
    ScopedDword size(kKey, L"LogMaxSizeInMb", 4096);
    EXPECT_TRUE(Select({{L"a", 4000 * kMiB, kNow - kHour}}, kNow).empty());
}

TEST(RetentionSelection, DefaultsAreThirtyDaysAndTenMebibytes)
{
    EXPECT_THAT(Select({{L"young", 9 * kMiB, kNow - 29 * kDay}, {L"old", 0, kNow - 30 * kDay}}, kNow),
                ElementsAre(L"old"));
    EXPECT_THAT(Select({{L"big", 10 * kMiB, kNow - kHour}}, kNow), ElementsAre(L"big"));
}

TEST(RetentionFolder, DeletesOnlyTheSinksFiles)
{
    TempFolder folder;
    for (const wchar_t* name : {L"Sink-1.log", L"Sink-2.log", L"Other-1.log", L"Sink-1.txt"}) {
        HANDLE file = CreateFileW((folder.Path() + name).c_str(), GENERIC_WRITE, 0, nullptr, CREATE_NEW, 0, nullptr);
        ASSERT_NE(file, INVALID_HANDLE_VALUE);
        CloseHandle(file);
    }
    LogRetention retention(kKey, L"Sink*.log", folder.Path());
    std::vector<std::wstring> found;
    for (const auto& file : retention.GetFiles()) {
        found.push_back(file.path);
    }
    EXPECT_THAT(found, UnorderedElementsAre(folder.Path() + L"Sink-1.log", folder.Path() + L"Sink-2.log"));

    // Everything matching may go; the other names stay.
    ScopedDword days(kKey, L"LogExpiredPeriodInDays", 0);
    ScopedDword size(kKey, L"LogMaxSizeInMb", 0);
    LogRetention(kKey, L"Sink*.log", folder.Path()).Run();
    EXPECT_TRUE(retention.GetFiles().empty());
    EXPECT_THAT(FindFiles(folder.Path(), L"*"),
                UnorderedElementsAre(folder.Path() + L"Other-1.log", folder.Path() + L"Sink-1.txt"));
}

TEST(RetentionFolder, MissingFolderIsEmpty)
{
    TempFolder folder;
    LogRetention retention(kKey, L"Sink*.log", folder.Path() + L"absent\\");
    EXPECT_TRUE(retention.GetFiles().empty());
    retention.Run();
}

TEST(RetentionTime, BadSystemTimeRaisesWithTheWindowsError)
{
    SYSTEMTIME bad = {};
    bad.wMonth = 13;
    try {
        ToFileTime(bad);
        FAIL() << "no error raised";
    } catch (const Common::Error& error) {
        EXPECT_EQ(error.Code(), 1u);
        EXPECT_EQ(error.Text(), L"Failed to convert to FILETIME");
        EXPECT_EQ(error.Cause().Code(), 0xFFF0u);
    }
}

}  // namespace
