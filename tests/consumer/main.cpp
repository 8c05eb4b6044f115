#include <zelt/com/bstr.h>

#include <cstdio>

int main()
{
    const Qor::BSTR text = Qor::SysAllocString(L"frame");
    const bool right = Qor::SysStringLen(text) == 5;
    Qor::SysFreeString(text);
    if (!right) std::fputs("the string does not have its length\n", stderr);
    return right ? 0 : 1;
}
