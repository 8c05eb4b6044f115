#include "common/interfaces.h"

using namespace Qor;

namespace host {

const interface_info* table_of(IDispatch* object)
{
    com_ptr<ITypeInfo> type;
    if (!object || failed(object->GetTypeInfo(0, LOCALE_USER_DEFAULT, type.put())) || !type) return nullptr;
    return type->Describe();
}

std::vector<const argument_info*> inputs_of(const method_info& method)
{
    std::vector<const argument_info*> inputs;
    for (const argument_info& a : method.arguments)
        if (a.way == direction::in) inputs.push_back(&a);
    return inputs;
}

} // namespace host
