#include "zelt/com/class_registry.h"

#include "com/module_use.h"
#include "com/probe.h"

#include <gtest/gtest.h>

using namespace Qor;

namespace {

IUnknown* last_outer = nullptr;

HRESULT create_probe(IUnknown* outer, const GUID& id, void** out) noexcept
{
    last_outer = outer;
    return make_probe()->QueryInterface(id, out);
}

constexpr class_entry entry{guid("00000001-0000-0000-0000-0000000000ff"), "Probe.Thing.1", "Probe.Thing",
                            "a probe", create_probe};
const GUID other = guid("00000002-0000-0000-0000-0000000000ff");

TEST(ClassRegistry, CreatesKnownClassesByIdentifierAndName)
{
    const class_entry nameless{other, nullptr, nullptr, "", create_probe};
    com_ptr<IDispatch> object;
    {
        const class_registration known(entry), nameless_known(nameless);
        EXPECT_EQ(CoCreateInstance(entry.class_id, nullptr, CLSCTX_ALL, IDispatch::iid, object.put_void()),
                  S_OK);
        EXPECT_TRUE(object);
        EXPECT_EQ(CoCreateInstance(other, nullptr, 1, IDispatch::iid, object.put_void()), S_OK);
        EXPECT_EQ(CoCreateInstance(other, nullptr, 1, IErrorInfo::iid, object.put_void()), E_NOINTERFACE);
        EXPECT_EQ(CoCreateInstance(other, nullptr, 4, IDispatch::iid, object.put_void()),
                  REGDB_E_CLASSNOTREG);
        EXPECT_EQ(CoCreateInstance(other, nullptr, 1, IDispatch::iid, nullptr), E_POINTER);
        GUID id{};
        for (const wchar_t* name : {L"Probe.Thing", L"probe.thing.1", L"PROBE.THING"}) {
            EXPECT_EQ(CLSIDFromProgID(name, &id), S_OK);
            EXPECT_EQ(id, entry.class_id);
        }
        for (const wchar_t* name : {L"", L"Probe", L"Probe.Thing.12", L"Probe.Thing.2"}) {
            EXPECT_EQ(CLSIDFromProgID(name, &id), CO_E_CLASSSTRING);
            EXPECT_EQ(id, GUID_NULL);
        }
        EXPECT_EQ(CLSIDFromProgID(nullptr, &id), E_POINTER);
        EXPECT_STREQ(prog_id_of(entry.class_id), "Probe.Thing");
        EXPECT_EQ(prog_id_of(other), nullptr);
    }
    for (const GUID& id : {entry.class_id, other}) {
        EXPECT_EQ(CoCreateInstance(id, nullptr, CLSCTX_ALL, IDispatch::iid, object.put_void()),
                  REGDB_E_CLASSNOTREG);
        EXPECT_EQ(CoGetClassObject(id, CLSCTX_ALL, IClassFactory::iid, object.put_void()),
                  REGDB_E_CLASSNOTREG);
    }
}

TEST(ClassRegistry, FactoriesCreateLockAndAggregate)
{
    const class_registration known(entry);
    com_ptr<IClassFactory> factory;
    EXPECT_EQ(CoGetClassObject(entry.class_id, CLSCTX_ALL, IDispatch::iid, factory.put_void()),
              E_NOINTERFACE);
    ASSERT_EQ(CoGetClassObject(entry.class_id, CLSCTX_ALL, IClassFactory::iid, factory.put_void()), S_OK);
    const auto outer = make_probe();
    com_ptr<IUnknown> object;
    EXPECT_EQ(factory->CreateInstance(nullptr, IDispatch::iid, object.put_void()), S_OK);
    EXPECT_EQ(factory->CreateInstance(outer.get(), IDispatch::iid, object.put_void()), CLASS_E_NOAGGREGATION);
    EXPECT_FALSE(object);
    EXPECT_EQ(factory->CreateInstance(outer.get(), IUnknown::iid, object.put_void()), S_OK);
    EXPECT_EQ(last_outer, outer.get());
    EXPECT_EQ(factory->CreateInstance(nullptr, IUnknown::iid, nullptr), E_POINTER);
    EXPECT_EQ(server_lock_count(), 0);
    EXPECT_EQ(factory->LockServer(1), S_OK);
    EXPECT_EQ(server_lock_count(), 1);
    EXPECT_EQ(factory->LockServer(0), S_OK);
    EXPECT_EQ(factory->LockServer(0), E_UNEXPECTED);
    EXPECT_EQ(server_lock_count(), 0);
}

} // namespace
