#include "frame/errors.h"

#include "zelt/com/error_info.h"

#include <cxxabi.h>

#include <cstdio>
#include <cstdlib>
#include <memory>

namespace Qor {

HResultException::HResultException(HRESULT code) : std::runtime_error(""), hresult(code) {}

HResultException::HResultException(HRESULT code, const std::string& text)
    : std::runtime_error(""), hresult(code), description(widen(text))
{
}

HResultException::HResultException(HRESULT code, std::wstring error_source, std::wstring text,
                                   std::wstring help_file, uint32_t help_context)
    : std::runtime_error(""), hresult(code), source(std::move(error_source)), description(std::move(text)),
      helpFile(std::move(help_file)), helpContext(help_context)
{
}

HResultException::~HResultException() = default;

const char* HResultException::what() const noexcept
{
    try {
        if (text_.empty()) {
            char code[9];
            std::snprintf(code, sizeof code, "%X", static_cast<unsigned>(hresult));
            std::string text = std::string("HRESULT ") + code;
            if (const char* meaning = system_message(hresult)) text += std::string(": ") + meaning;
            if (!description.empty()) text += ": " + narrow(description);
            if (!source.empty()) text += "\nSource: " + narrow(source);
            text_ = std::move(text);
        }
        return text_.c_str();
    } catch (...) {
        return "HRESULT";
    }
}

const char* system_message(HRESULT code) noexcept
{
    switch (code) {
    case S_OK: return "success";
    case S_FALSE: return "success, answer no";
    case E_NOTIMPL: return "not implemented";
    case E_NOINTERFACE: return "the object does not have this interface";
    case E_POINTER: return "a pointer is null";
    case E_FAIL: return "failed";
    case E_UNEXPECTED: return "unexpected failure";
    case E_ACCESSDENIED: return "access denied";
    case E_OUTOFMEMORY: return "out of memory";
    case E_INVALIDARG: return "invalid argument";
    case E_SIZE_MISMATCH: return "sizes differ";
    case CLASS_E_NOAGGREGATION: return "the class cannot be part of another object";
    case CLASS_E_CLASSNOTAVAILABLE: return "class not available";
    case REGDB_E_READREGDB: return "registration cannot be read";
    case REGDB_E_WRITEREGDB: return "registration cannot be written";
    case REGDB_E_INVALIDVALUE: return "registration is damaged";
    case REGDB_E_CLASSNOTREG: return "class not registered";
    case CO_E_DLLNOTFOUND: return "module not found";
    case CO_E_ERRORINDLL: return "not a module";
    case CO_E_CLASSSTRING: return "unknown class name";
    case DISP_E_MEMBERNOTFOUND: return "no such method or property";
    case DISP_E_PARAMNOTFOUND: return "no such argument";
    case DISP_E_TYPEMISMATCH: return "an argument has the wrong type";
    case DISP_E_UNKNOWNNAME: return "unknown name";
    case DISP_E_BADVARTYPE: return "unknown value type";
    case DISP_E_EXCEPTION: return "the method failed";
    case DISP_E_OVERFLOW: return "a number is out of range";
    case DISP_E_BADINDEX: return "index out of range";
    case DISP_E_ARRAYISLOCKED: return "the array is in use";
    case DISP_E_BADPARAMCOUNT: return "wrong number of arguments";
    case DISP_E_PARAMNOTOPTIONAL: return "a required argument is missing";
    default: return nullptr;
    }
}

void CheckHResult::raise(HRESULT code, const std::wstring& description)
{
    HResultException failure(code, {}, description, {}, 0);
    com_ptr<IErrorInfo> info;
    GetErrorInfo(0, info.put());
    if (info) {
        bstr text;
        if (failure.source.empty() && succeeded(info->GetSource(text.put()))) failure.source = text.view();
        if (failure.description.empty() && succeeded(info->GetDescription(text.put())))
            failure.description = text.view();
        if (failure.helpFile.empty() && succeeded(info->GetHelpFile(text.put())))
            failure.helpFile = text.view();
        info->GetHelpContext(&failure.helpContext);
    }
    throw failure;
}

std::string detail::bad_enum_text(const std::type_info& to, const std::type_info& from, int64_t value)
{
    const auto spelled = [](const std::type_info& t) {
        const std::unique_ptr<char, void (*)(void*)> name(
            abi::__cxa_demangle(t.name(), nullptr, nullptr, nullptr), std::free);
        return std::string(name ? name.get() : t.name());
    };
    return "bad_enum_cast: enum_cast<" + spelled(to) + ">(" + spelled(from) + "(" + std::to_string(value) +
           "))";
}

} // namespace Qor
