// How often clients asked, through IClassFactory::LockServer, that the library stay loaded.
#pragma once

#include "zelt/com/types.h"

namespace Qor {

LONG server_lock_count() noexcept;

} // namespace Qor
