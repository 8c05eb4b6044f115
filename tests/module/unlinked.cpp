// A component host that is not linked to the library: all that it knows of it are headers, a record and a class's name.
//   test_module LIBRARY
#include <zelt/interfaces/zelt.h>
#include <zelt/module.h>
#include <zelt/pixmat/pixmat.h>

#include <gtest/gtest.h>

#include <filesystem>
#include <fstream>
#include <sys/stat.h>

namespace {

using namespace Qor;
using namespace Qor::Luxar;
using namespace Qor::Luxar::ZELT;
namespace fs = std::filesystem;

std::string library;

/// With data folders of its own, and nothing of the library loaded by this host.
class ModuleHost : public ::testing::Test {
protected:
    void SetUp() override
    {
        char name[] = "/tmp/zelt_module_XXXXXX";
        ASSERT_TRUE(mkdtemp(name));
        folder = name;
        setenv("XDG_DATA_HOME", (folder / "user").c_str(), 1);
        setenv("XDG_DATA_DIRS", ("relative:" + (folder / "machine").string() + "::/nowhere").c_str(), 1);
    }
    void TearDown() override { fs::remove_all(folder); }

    static HRESULT call(const char* name)
    {
        void* const handle = dlopen(library.c_str(), RTLD_NOW | RTLD_LOCAL);
        EXPECT_TRUE(handle) << dlerror();
        const auto function = reinterpret_cast<HRESULT (*)()>(dlsym(handle, name));
        EXPECT_TRUE(function) << name;
        const HRESULT hr = function();
        dlclose(handle);
        return hr;
    }

    fs::path record(const char* whose = "user") const { return folder / whose / "zelt/ZELT.module"; }
    void write(const fs::path& file, const std::string& text) const
    {
        fs::create_directories(file.parent_path());
        std::ofstream(file) << text;
    }
    std::string written() const
    {
        std::ifstream file(record());
        return {std::istreambuf_iterator<char>(file), {}};
    }
    void expect_refused(HRESULT code, const std::string& text, const char* name = "ZELT.Main2")
    {
        zelt::module module;
        std::string why;
        EXPECT_EQ(static_cast<uint32_t>(module.open(name, &why)), static_cast<uint32_t>(code)) << why;
        EXPECT_NE(why.find(text), why.npos) << why;
        EXPECT_FALSE(module);
    }

    fs::path folder;
};

TEST_F(ModuleHost, FindsEveryClassByNameAndComputes)
{
    ASSERT_EQ(call("DllRegisterServer"), S_OK);
    for (const char* name : {"ZELT.Main", "ZELT.Main.1", "ZELT.Main2", "zelt.main2.1", "ZELT.Complex",
                             "ZELT.Complex.1", "ZELT.PixmatFactory"}) {
        zelt::module module;
        std::string why;
        ASSERT_EQ(module.open(name, &why), S_OK) << name << ": " << why;
        com_ptr<IUnknown> object;
        EXPECT_EQ(module.create(object), S_OK) << name;
        EXPECT_EQ(module.unload(), S_FALSE);
        object = {};
        EXPECT_EQ(module.unload(), S_OK);
        EXPECT_FALSE(module);
    }
    zelt::module module;
    ASSERT_EQ(module.open("ZELT.Main2"), S_OK);
    EXPECT_EQ(module.path(), library);
    {
        com_ptr<IZELT2> root, plain;
        com_ptr<IStatistics> statistics;
        com_ptr<IPixmatDescriptor> descriptor;
        com_ptr<IPixmatFactory> factory;
        com_ptr<IPixmat2> image;
        ASSERT_EQ(module.create(root), S_OK);
        EXPECT_EQ(module.create(CLSID_ZELT2NoDispatch, plain), S_OK);
        ASSERT_EQ(root->get_Statistics(statistics.put()), S_OK);
        ASSERT_EQ(module.create(CLSID_PixmatDescriptor, descriptor), S_OK);
        ASSERT_EQ(module.create(CLSID_PixmatFactory, factory), S_OK);
        descriptor->put_Width(5);
        descriptor->put_Height(4);
        descriptor->put_Bits(16);
        descriptor->put_Encoding(PixmatEncoding_Unsigned);
        ASSERT_EQ(factory->Create(descriptor.get(), PixmatCreateMode_Packed, image.put()), S_OK);
        com_ptr<IPixmatLock> lock;
        ASSERT_EQ(image->OpenWrite(lock.put()), S_OK);
        reinterpret_cast<uint16_t*>(lock->Data(0))[7] = 40;
        ASSERT_EQ(lock->Commit(nullptr), S_OK);
        lock = {};
        double mean = 0;
        EXPECT_EQ(statistics->Mean(image.get(), nullptr, &mean), S_OK);
        EXPECT_EQ(mean, 2);
        EXPECT_EQ(statistics->Mean(nullptr, nullptr, &mean),
                  E_INVALIDARG); // and its text does not hold the module
    }
    EXPECT_EQ(module.unload(), S_OK);
}

TEST_F(ModuleHost, RegistersWholeFilesAndRemovesThem)
{
    expect_refused(CO_E_CLASSSTRING, "ZELT.Main2");
    EXPECT_EQ(call("DllUnregisterServer"), S_OK);
    write(record(), "an older record, much longer" + std::string(9000, '.'));
    ASSERT_EQ(call("DllRegisterServer"), S_OK);
    const std::string first = written();
    EXPECT_NE(first.find("\nPath=" + library + "\n"), first.npos);
    EXPECT_EQ(first.find("ZELT2NoDispatch"), first.npos); // found by its identifier only
    EXPECT_EQ(first.find("-0003-"), first.npos);
    ASSERT_EQ(call("DllRegisterServer"), S_OK);
    EXPECT_EQ(written(), first);
    EXPECT_EQ(std::distance(fs::directory_iterator(record().parent_path()), {}),
              1); // nothing temporary stays
    EXPECT_EQ(static_cast<int>(fs::status(record()).permissions()), 0644);
    EXPECT_EQ(call("DllUnregisterServer"), S_OK);
    EXPECT_FALSE(fs::exists(record()));
    expect_refused(CO_E_CLASSSTRING, "ZELT.Main2");
}

TEST_F(ModuleHost, FailsToRegisterWhereNoFolderCanBe)
{
    write(folder / "user", "a file");
    EXPECT_EQ(static_cast<uint32_t>(call("DllRegisterServer")), static_cast<uint32_t>(REGDB_E_WRITEREGDB));
    EXPECT_EQ(call("DllUnregisterServer"), S_OK);
    fs::remove(folder / "user");
    fs::create_directories(record()); // in the record's place: cannot be replaced by a file
    EXPECT_EQ(static_cast<uint32_t>(call("DllRegisterServer")), static_cast<uint32_t>(REGDB_E_WRITEREGDB));
    EXPECT_EQ(std::distance(fs::directory_iterator(record().parent_path()), {}), 1);
}

TEST_F(ModuleHost, LooksAtTheUsersRecordFirst)
{
    ASSERT_EQ(call("DllRegisterServer"), S_OK);
    const std::string good = written();
    fs::create_directories(record("machine").parent_path());
    fs::rename(record(), record("machine"));
    zelt::module module;
    ASSERT_EQ(module.open("ZELT.Main2"), S_OK);
    EXPECT_EQ(module.unload(), S_OK);

    // A user's record without the class leaves the word to the machine's; a damaged one does not.
    write(record(), "[Module]\nFormat=1\nPath=/nowhere/lib.so\n");
    ASSERT_EQ(module.open("ZELT.Main2"), S_OK);
    EXPECT_EQ(module.unload(), S_OK);
    write(record(), good.substr(0, good.size() / 2) + '\0');
    expect_refused(REGDB_E_INVALIDVALUE, record().string() + " is damaged, line ");
    write(record(), std::string(zelt::most_record_bytes + 1, '\n'));
    expect_refused(REGDB_E_READREGDB, record().string());
    fs::remove(record());
    fs::create_directory(record());
    expect_refused(REGDB_E_READREGDB, record().string());
    fs::remove(record());
    ASSERT_EQ(mkfifo(record().c_str(), 0600), 0);
    expect_refused(REGDB_E_INVALIDVALUE, "no Format");
}

TEST_F(ModuleHost, TellsWhyALibraryDoesNotLoad)
{
    ASSERT_EQ(call("DllRegisterServer"), S_OK);
    const std::string good = written();
    const auto with_path = [&](const std::string& path) {
        std::string text = good;
        text.replace(text.find(library), library.size(), path);
        write(record(), text);
    };
    with_path("/nowhere/libzelt.so.1");
    expect_refused(CO_E_DLLNOTFOUND, "/nowhere/libzelt.so.1");
    with_path(record());
    expect_refused(CO_E_DLLNOTFOUND, record());
    Dl_info info{};
    ASSERT_TRUE(dladdr(reinterpret_cast<void*>(&realpath), &info)); // a library, but no module
    with_path(fs::canonical(info.dli_fname));
    expect_refused(CO_E_ERRORINDLL, "DllGetClassObject");
}

} // namespace

int main(int argc, char** argv)
{
    testing::InitGoogleTest(&argc, argv);
    if (argc != 2) return std::fputs("test_module LIBRARY\n", stderr), 2;
    library = argv[1];
    return RUN_ALL_TESTS();
}
