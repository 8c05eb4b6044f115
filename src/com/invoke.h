// Late-bound calls over an interface table.
#pragma once

#include "zelt/com/interface_table.h"

namespace Qor {

/// What IDispatch::Invoke was given.
struct invoke_request {
    DISPID id;
    uint16_t flags;
    DISPPARAMS* params;
    VARIANT* result;
    EXCEPINFO* exception;
    uint32_t* bad_argument; ///< index into rgvarg of the argument that did not convert
};

/// How a call treats its arguments.
/// standard   what a type library's own Invoke does: optional numbers may be left out, objects may not.
/// scripting  for methods that take images: any optional argument may be left out, an image must come as an
///            object (E_INVALIDARG otherwise). Other methods behave as in the standard form.
enum class invoke_form { standard, scripting };

/// `self` is the described interface. A method that fails answers DISP_E_EXCEPTION with the thread's error
/// information in the exception record.
HRESULT invoke(const interface_info& table, IUnknown* self, invoke_form form,
               const invoke_request& request) noexcept;

/// names[0] is a method or property, the others its arguments; case does not matter. Unknown ones get DISPID_UNKNOWN
/// and the answer is DISP_E_UNKNOWNNAME.
HRESULT find_ids(const interface_info& table, OLECHAR** names, uint32_t count, DISPID* ids) noexcept;

HRESULT get_type_info(const interface_info& table, uint32_t index, ITypeInfo** info) noexcept;

} // namespace Qor
