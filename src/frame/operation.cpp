#include "frame/operation.h"

namespace Qor::Luxar::ZELT {

HRESULT detail::run_frame(const GUID& interface_id, HRESULT (*body)(void*), void* context) noexcept
{
    try {
        return body(context);
    } catch (...) {
        return ReportCurrentException(interface_id);
    }
}

com_ptr<IPixmat2> committed(ImageWriteAccess& dst)
{
    CheckHResult(dst.Commit());
    return com_ptr<IPixmat2>(dst.image());
}

} // namespace Qor::Luxar::ZELT
