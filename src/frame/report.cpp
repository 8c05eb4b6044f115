#include "frame/report.h"

#include "frame/exception_translator.h"
#include "zelt/com/class_registry.h"
#include "zelt/com/error_info.h"

namespace Qor {
namespace {

struct error_texts {
    const wchar_t* source;
    const wchar_t* description;
    const wchar_t* help_file;
    uint32_t help_context;
};

/// A step that fails abandons the error object; the call's own code is answered all the same.
void leave_error(const GUID& interface_id, const error_texts& texts) noexcept
{
    com_ptr<ICreateErrorInfo> made;
    if (failed(CreateErrorInfo(made.put()))) return;
    if (failed(made->SetGUID(interface_id)) || failed(made->SetSource(texts.source)) ||
        failed(made->SetDescription(texts.description)) || failed(made->SetHelpFile(texts.help_file)) ||
        failed(made->SetHelpContext(texts.help_context)))
        return;
    SetErrorInfo(0, made.as<IErrorInfo>().get());
}

} // namespace

HRESULT ReportCurrentException(const GUID& interface_id) noexcept
{
    try {
        const HResultException failure = TranslateCurrentException();
        leave_error(interface_id, {failure.source.c_str(), failure.description.c_str(),
                                   failure.helpFile.c_str(), failure.helpContext});
        return failure.hresult;
    } catch (...) { // no memory left for the texts
        return E_OUTOFMEMORY;
    }
}

HRESULT ReportError(const GUID& class_id, const wchar_t* message, const GUID& interface_id,
                    HRESULT code) noexcept
{
    try {
        const char* name = prog_id_of(class_id);
        leave_error(interface_id, {widen(name ? name : "").c_str(), message, L"", 0});
    } catch (...) { // as above: the code is what counts
    }
    return code;
}

} // namespace Qor
