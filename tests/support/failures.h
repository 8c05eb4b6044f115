// What a failed call left behind.
#pragma once

#include "zelt/com/error_info.h"

#include <gtest/gtest.h>

namespace Qor::Luxar::ZELT::Test {

struct left_behind {
    std::wstring source;
    std::wstring description;
    GUID interface_id = GUID_NULL;
};

/// Takes the thread's error information; empty when there is none.
inline left_behind take_error()
{
    left_behind left;
    com_ptr<IErrorInfo> info;
    if (GetErrorInfo(0, info.put()) != S_OK) return left;
    bstr text;
    if (succeeded(info->GetSource(text.put()))) left.source = text.view();
    if (succeeded(info->GetDescription(text.put()))) left.description = text.view();
    info->GetGUID(&left.interface_id);
    return left;
}

/// A call fails with a code and a text; an empty text means that it leaves none.
template <class Call>
void expect_fails(HRESULT code, const std::wstring& text, Call&& call)
{
    SetErrorInfo(0, nullptr);
    EXPECT_EQ(static_cast<uint32_t>(call()), static_cast<uint32_t>(code)) << narrow(text);
    EXPECT_EQ(narrow(take_error().description), narrow(text));
}

} // namespace Qor::Luxar::ZELT::Test
