// Strings, identifiers and the error information of a thread.
#include "com/probe.h"
#include "zelt/com/error_info.h"

#include <gtest/gtest.h>

#include <thread>

using namespace Qor;

namespace {

com_ptr<ICreateErrorInfo> new_info(const wchar_t* description)
{
    com_ptr<ICreateErrorInfo> info;
    EXPECT_EQ(CreateErrorInfo(info.put()), S_OK);
    EXPECT_EQ(info->SetDescription(description), S_OK);
    return info;
}

TEST(ErrorInfo, GivesBackWhatWasSet)
{
    const auto info = new_info(L"went wrong");
    EXPECT_EQ(info->SetGUID(IDispatch::iid), S_OK);
    EXPECT_EQ(info->SetSource(L"ZELT.Main2"), S_OK);
    EXPECT_EQ(info->SetHelpFile(L""), S_OK);
    EXPECT_EQ(info->SetHelpContext(77), S_OK);
    EXPECT_EQ(info->SetDescription(L"went very wrong"), S_OK);
    EXPECT_EQ(info->SetSource(nullptr), E_POINTER);
    const auto read = info.as<IErrorInfo>();
    ASSERT_TRUE(read && same_object(read.get(), info.get()));
    GUID id{};
    bstr source, description, help_file;
    uint32_t context = 0;
    EXPECT_EQ(read->GetGUID(&id), S_OK);
    EXPECT_EQ(read->GetSource(source.put()), S_OK);
    EXPECT_EQ(read->GetDescription(description.put()), S_OK);
    EXPECT_EQ(read->GetHelpFile(help_file.put()), S_OK);
    EXPECT_EQ(read->GetHelpContext(&context), S_OK);
    EXPECT_EQ(id, IDispatch::iid);
    EXPECT_EQ(source.view(), L"ZELT.Main2");
    EXPECT_EQ(description.view(), L"went very wrong");
    EXPECT_EQ(help_file.view(), L"");
    EXPECT_EQ(context, 77u);
    for (const HRESULT hr : {read->GetGUID(nullptr), read->GetSource(nullptr), read->GetHelpContext(nullptr),
                             CreateErrorInfo(nullptr), GetErrorInfo(0, nullptr)})
        EXPECT_EQ(hr, E_POINTER);
}

TEST(ErrorInfo, IsHandedOverOnce)
{
    const auto info = new_info(L"x").as<IErrorInfo>();
    com_ptr<IErrorInfo> got;
    EXPECT_EQ(SetErrorInfo(0, info.get()), S_OK);
    EXPECT_EQ(SetErrorInfo(1, nullptr), E_INVALIDARG);
    EXPECT_EQ(GetErrorInfo(1, got.put()), E_INVALIDARG);
    EXPECT_EQ(GetErrorInfo(0, got.put()), S_OK);
    EXPECT_EQ(got, info);
    EXPECT_EQ(GetErrorInfo(0, got.put()), S_FALSE);
    EXPECT_FALSE(got);
    EXPECT_EQ(SetErrorInfo(0, info.get()), S_OK);
    EXPECT_EQ(SetErrorInfo(0, nullptr), S_OK);
    EXPECT_EQ(GetErrorInfo(0, got.put()), S_FALSE);
    EXPECT_EQ(references(info.get()), 1u);
}

TEST(ErrorInfo, BelongsToItsThreadAndEndsWithIt)
{
    const auto mine = new_info(L"mine").as<IErrorInfo>();
    const auto theirs = new_info(L"theirs").as<IErrorInfo>();
    EXPECT_EQ(SetErrorInfo(0, mine.get()), S_OK);
    HRESULT before = S_OK;
    std::thread([&] {
        com_ptr<IErrorInfo> got;
        before = GetErrorInfo(0, got.put());
        SetErrorInfo(0, theirs.get());
    }).join();
    EXPECT_EQ(before, S_FALSE);
    EXPECT_EQ(references(theirs.get()), 1u);
    com_ptr<IErrorInfo> got;
    EXPECT_EQ(GetErrorInfo(0, got.put()), S_OK);
    EXPECT_EQ(got, mine);
}

TEST(Bstr, KeepsItsLengthAndEndsWithZero)
{
    const bstr text(std::wstring_view(L"a\0b", 3));
    EXPECT_EQ(SysStringLen(text.get()), 3u);
    EXPECT_EQ(text.view(), std::wstring_view(L"a\0b", 3));
    EXPECT_EQ(text.get()[3], 0);
    const bstr zeros = bstr::attach(SysAllocStringLen(nullptr, 2));
    EXPECT_EQ(zeros.view(), std::wstring_view(L"\0\0", 2));
    EXPECT_EQ(SysAllocString(nullptr), nullptr);
    EXPECT_EQ(SysStringLen(nullptr), 0u);
    SysFreeString(nullptr);
}

TEST(Bstr, WidensBytesAndNarrowsBack)
{
    EXPECT_EQ(widen("a\xff"), L"a\xff");
    EXPECT_EQ(narrow(L"a\xff\x100\x20ac"), "a\xff??");
}

TEST(Guid, IsWrittenAsItIsRead)
{
    char text[39];
    guid_to_text(guid("01234567-89ab-CDEF-0f1e-2d3c4b5a6978"), text);
    EXPECT_STREQ(text, "{01234567-89AB-CDEF-0F1E-2D3C4B5A6978}");
}

} // namespace
