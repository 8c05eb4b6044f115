#include "zelt/module.h"

#include "zelt/zelt.h"

#include <gtest/gtest.h>

#include <random>

namespace {

using namespace zelt;

constexpr GUID all_classes[] = {CLSID_ZELT,           CLSID_ZELT2,         CLSID_ZELT2NoDispatch,
                                CLSID_Complex,        CLSID_PixmatFactory, CLSID_PixmatDescriptor,
                                CLSID_PixmatConverter};

TEST(Module, HandsOutItsClassObjectsAndNoOthers)
{
    for (const GUID& id : all_classes) {
        com_ptr<IClassFactory> factory;
        ASSERT_EQ(DllGetClassObject(id, IClassFactory::iid, factory.put_void()), S_OK);
        com_ptr<IUnknown> object;
        EXPECT_EQ(factory->CreateInstance(nullptr, IUnknown::iid, object.put_void()), S_OK);
        EXPECT_TRUE(object);
    }
    com_ptr<IUnknown> other;
    EXPECT_EQ(DllGetClassObject(IUnknown::iid, IClassFactory::iid, other.put_void()),
              CLASS_E_CLASSNOTAVAILABLE);
    EXPECT_EQ(DllGetClassObject(CLSID_ZELT2, IZELT2::iid, other.put_void()), E_NOINTERFACE);
    EXPECT_EQ(DllGetClassObject(CLSID_ZELT2, IClassFactory::iid, nullptr), E_POINTER);
}

TEST(Module, StaysWhileAnObjectOrALockLives)
{
    SetErrorInfo(0, nullptr);
    ASSERT_EQ(DllCanUnloadNow(), S_OK);
    for (const GUID& id : all_classes) {
        com_ptr<IUnknown> object;
        ASSERT_EQ(CoCreateInstance(id, nullptr, CLSCTX_ALL, IUnknown::iid, object.put_void()), S_OK);
        EXPECT_EQ(DllCanUnloadNow(), S_FALSE);
    }
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
    {
        com_ptr<IStatistics> facet; // outlives its root
        facet = get(create<IZELT2>("ZELT.Main2"), &IZELT2::get_Statistics);
        EXPECT_EQ(DllCanUnloadNow(), S_FALSE);
        const auto image = new_image(3, 3, 8);
        EXPECT_EQ(call(facet, &IStatistics::Mean, image), 0);
        EXPECT_THROW(call(facet, &IStatistics::Mean, com_ptr<IPixmat2>()), error);
    }
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
    com_ptr<IClassFactory> factory;
    ASSERT_EQ(DllGetClassObject(CLSID_Complex, IClassFactory::iid, factory.put_void()), S_OK);
    EXPECT_EQ(factory->LockServer(1), S_OK);
    factory = {};
    EXPECT_EQ(DllCanUnloadNow(), S_FALSE);
    ASSERT_EQ(DllGetClassObject(CLSID_Complex, IClassFactory::iid, factory.put_void()), S_OK);
    EXPECT_EQ(factory->LockServer(0), S_OK);
    factory = {};
    EXPECT_EQ(DllCanUnloadNow(), S_OK);
}

constexpr std::string_view good =
    "# by hand\n[Module]\nFormat=1\nName=ZELT\nPath=/opt/a b/libzelt.so.1\n\n[Later]\nx=\n"
    "[Class]\nClassID={5A1E0001-0002-4000-8000-00000000C0DE}\nProgID=ZELT.Main2.1\n"
    "VersionIndependentProgID=ZELT.Main2\nUnknown=1\n"
    "[Class]\nClassID={5a1e0001-0003-4000-8000-00000000c0de}\n";

TEST(ModuleRecord, TellsPathAndClasses)
{
    module_record record;
    std::string why;
    ASSERT_TRUE(read_record(good, record, why)) << why;
    EXPECT_EQ(record.path, "/opt/a b/libzelt.so.1");
    ASSERT_EQ(record.classes.size(), 2u);
    EXPECT_EQ(record.classes[0].class_id, CLSID_ZELT2);
    EXPECT_EQ(record.classes[1].class_id, CLSID_ZELT2NoDispatch);
    for (const char* name : {"ZELT.Main2", "zelt.MAIN2.1"}) EXPECT_TRUE(record.classes[0].answers_to(name));
    for (const char* name : {"", "ZELT.Main", "ZELT.Main2."}) {
        EXPECT_FALSE(record.classes[0].answers_to(name));
        EXPECT_FALSE(record.classes[1].answers_to(name));
    }
}

TEST(ModuleRecord, SaysWhichLineIsDamaged)
{
    const struct {
        std::string_view from;
        std::string to, why;
    } cases[] = {
        {"Format=1", "Format=2", "line 3: a format of another version"},
        {"Format=1\n", "", "line 14: no Format in [Module]"},
        {"Path=/", "Path=", "line 5: a path that is not absolute"},
        {"Path=/opt/a b/libzelt.so.1\n", "", "line 14: no Path in [Module]"},
        {"Name=ZELT", "Name", "line 4: neither a section nor key=value"},
        {"Name=ZELT", std::string("Name=\0", 6), "line 4: a control character"},
        {"{5A1E0001-0002", "{5A1E0001_0002", "line 10: a class identifier of another form"},
        {"{5A1E0001-0002", "{5A1E000G-0002", "line 10: a class identifier of another form"},
        {"C0DE}", "C0DE", "line 10: a class identifier of another form"},
        {"ClassID={5A1E0001-0002-4000-8000-00000000C0DE}\n", "", "line 14: a [Class] without ClassID"},
        {"[Later]", "[Module]", "line 7: a second [Module]"},
        {"c0de}\n", "c0de}", "line 15: the record ends in the middle of a line"}};
    for (const auto& c : cases) {
        std::string text(good), why;
        text.replace(text.find(c.from), c.from.size(), c.to);
        module_record record;
        EXPECT_FALSE(read_record(text, record, why)) << c.why;
        EXPECT_EQ(why, c.why);
    }
    module_record record;
    std::string why;
    EXPECT_FALSE(read_record("", record, why));
}

/// Any bytes are a record with a path and identified classes, or a reason.
TEST(ModuleRecord, AnyBytesAreARecordOrAReason)
{
    std::mt19937 random(20);
    int accepted = 0, refused = 0;
    for (int i = 0; i < 20000; ++i) {
        std::string text(good), why;
        for (auto n = random() % 6; n > 0 && !text.empty(); --n) {
            const size_t at = random() % text.size();
            if (random() % 3 == 0)
                text.erase(at, random() % 40);
            else
                text[at] = random() % 2 ? static_cast<char>(random()) : "\n=[]{}/"[random() % 7];
        }
        module_record record;
        if (read_record(text, record, why)) {
            ++accepted;
            ASSERT_EQ(record.path.substr(0, 1), "/");
        } else {
            ++refused;
            ASSERT_EQ(why.substr(0, 5), "line ");
        }
    }
    EXPECT_GT(accepted, 1000);
    EXPECT_GT(refused, 1000);
}

} // namespace
