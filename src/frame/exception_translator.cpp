#include "frame/exception_translator.h"

#include "com/held_over_fork.h"
#include "frame/errors.h"
#include "zelt/com/error_info.h"

#include <new>
#include <typeinfo>

namespace Qor {
namespace {

/// When memory is out, the code is more important than its text.
template <class Make>
HResultException at_least_the_code(HRESULT code, Make&& make_all)
{
    try {
        return make_all();
    } catch (const std::bad_alloc&) {
        return HResultException(code);
    }
}

HResultException with_text(HRESULT code, const std::exception& e)
{
    return at_least_the_code(code, [&] { return HResultException(code, e.what()); });
}

HResultException read_error_object(const com_error& e)
{
    HResultException failure(e.code());
    IErrorInfo* info = e.info();
    if (!info) return failure;
    bstr text;
    if (succeeded(info->GetSource(text.put()))) failure.source = text.view();
    if (succeeded(info->GetDescription(text.put()))) failure.description = text.view();
    if (succeeded(info->GetHelpFile(text.put()))) failure.helpFile = text.view();
    uint32_t context = 0;
    if (succeeded(info->GetHelpContext(&context))) failure.helpContext = context;
    return failure;
}

HResultException from_error_object(const com_error& e)
{
    return at_least_the_code(e.code(), [&] { return read_error_object(e); });
}

HRESULT of_system(int32_t code)
{
    return code <= 0 ? code : make_hresult((static_cast<uint32_t>(code) & 0xFFFF) | 0x80070000);
}

HResultException of_exception(const std::exception& e) { return with_text(E_FAIL, e); }
HResultException of_argument(const std::exception& e) { return with_text(E_INVALIDARG, e); }

/// The standard library names its own exception differently from one to the next; clients see one text.
HResultException of_memory(const std::bad_alloc& e)
{
    return at_least_the_code(E_OUTOFMEMORY, [&] {
        return HResultException(E_OUTOFMEMORY,
                                typeid(e) == typeid(std::bad_alloc) ? "bad allocation" : e.what());
    });
}

HResultException of_system_error(const win32_error& e) { return with_text(of_system(e.code()), e); }
HResultException of_code_error(const code_error& e) { return HResultException(e.code()); }
HResultException of_code(const HRESULT& code) { return HResultException(code); }
HResultException itself(const HResultException& e)
{
    return at_least_the_code(e.hresult, [&] { return e; });
}

template <class E, class Argument = E>
using element = ExceptionTranslator<E, HResultException (*)(const Argument&)>;

/// The innermost element has the first word, so the most general type stands outermost. Members are made in this
/// order: each refers to the one before it. Nothing is allocated, for the chain may be wanted first when memory is out.
struct chain {
    ExceptionTranslatorTail tail;
    element<win32_error> system_errors{of_system_error, tail};
    element<HRESULT> codes{of_code, system_errors};
    element<code_error> code_errors{of_code_error, codes};
    element<HResultException> translated{itself, code_errors};
    element<com_error> com_errors{from_error_object, translated};
    element<std::bad_alloc> memory{of_memory, com_errors};
    element<std::out_of_range, std::exception> ranges{of_argument, memory};
    element<std::invalid_argument, std::exception> arguments{of_argument, ranges};
    element<std::bad_cast, std::exception> casts{of_argument, arguments};
    element<std::exception> outermost{of_exception, casts};
};

constinit std::mutex chain_mutex;
const held_over_fork<chain_mutex> chain_is_fork_safe;

} // namespace

HResultException TranslateCurrentException()
{
    try {
        const std::lock_guard lock(chain_mutex);
        static const chain translators;
        return translators.outermost.translate();
    } catch (...) {
        return HResultException(E_UNEXPECTED);
    }
}

} // namespace Qor
