// The error record: empty success, chains, copy on write, Windows texts.
#include <gtest/gtest.h>

#include "common/error.h"

namespace {

using Common::Error;

TEST(ErrorRecord, CodeZeroIsTheEmptySuccess)
{
    EXPECT_EQ(Error::Make(COMMON_ERROR_SITE("f"), 0).Head(), nullptr);
    EXPECT_EQ(Error::Make(COMMON_ERROR_SITE("f"), 0, L"m", L"p", L"n").Code(), 0u);
    EXPECT_FALSE(Error::Success().Failed());
}

TEST(ErrorRecord, ParametersOfPathAndName)
{
    const Error error = Error::Make(COMMON_ERROR_SITE("f"), 0x00BE0081, L"missing", L"SOFTWARE\\A", L"B");
    EXPECT_EQ(error.Text(), L"missing");
    EXPECT_STREQ(error.StringParameter("path"), L"SOFTWARE\\A");
    EXPECT_STREQ(error.StringParameter("name"), L"B");
    EXPECT_STREQ(error.ParameterNames(), "path,name,$module");
    EXPECT_STREQ(error.ModuleParameter("$module"), "vss_requestor_vsa64_s_2769");
    EXPECT_EQ(error.ModuleParameter("$modul"), nullptr);
}

TEST(ErrorRecord, WindowsErrorOnEmptyHandleAndItsText)
{
    Error error;
    Common::AddWindowsError(error, 5);
    EXPECT_EQ(error.Code(), 0xFFF0u);
    EXPECT_EQ(error.NumberParameter("code"), 0x80070005u);
    const std::wstring text = error.Text();
    EXPECT_FALSE(text.empty());
    EXPECT_EQ(text.find(L'\r'), std::wstring::npos);
    EXPECT_NE(text.back(), L'.');

    Error negative;
    Common::AddWindowsError(negative, 0x80004005);
    EXPECT_EQ(negative.NumberParameter("code"), 0x80004005u);
}

TEST(ErrorRecord, SharedHeadIsCopiedBeforeTheCauseChanges)
{
    Error first = Error::Make(COMMON_ERROR_SITE("f"), 7, L"head");
    Common::AddWindowsError(first, 2);
    const Error second = first;
    Common::AddWindowsError(first, 5);
    EXPECT_NE(first.Head(), second.Head());
    EXPECT_EQ(second.Cause().NumberParameter("code"), 0x80070002u);
    EXPECT_EQ(first.Cause().NumberParameter("code"), 0x80070005u);
    EXPECT_EQ(first.Text(), L"head");
}

TEST(ErrorRecord, ChainIsFreedFrontToBackAndSharedTailSurvives)
{
    Error head = Error::Make(COMMON_ERROR_SITE("f"), 1, L"a");
    Common::AddWindowsError(head, 3);
    Error tail = head.Cause();
    head = Error();
    EXPECT_EQ(tail.NumberParameter("code"), 0x80070003u);
    EXPECT_EQ(tail.Head()->references.load(), 1u);
}

TEST(ErrorRecord, RaisedAndCaughtByType)
{
    try {
        throw Error::Make(COMMON_ERROR_SITE("f"), 1, L"raised");
    } catch (const Error& error) {
        EXPECT_EQ(error.Code(), 1u);
    }
}

}  // namespace
