#include "pixmat_objects.h"
#include "support/failing_new.h"

#include <thread>

namespace Qor::Luxar::Test {
namespace {

using ZELT::Test::with_failing_allocation;

HRESULT set(IPixmat2* image, const wchar_t* key, const variant& value)
{
    return query<IPixmatStatisticsStore>(image)->SetValue(bstr(key).get(), value.get());
}

HRESULT get(IPixmat2* image, const wchar_t* key, variant& value)
{
    return query<IPixmatStatisticsStore>(image)->GetValue(bstr(key).get(), value.put());
}

bool has(IPixmat2* image, const wchar_t* key)
{
    variant value;
    return get(image, key, value) == S_OK;
}

TEST(StatisticsStore, KeepsCopiesUnderExactKeys)
{
    const auto image = small_image();
    variant text(L"calm"), found;
    ASSERT_EQ(set(image.get(), L"stats:b", text), S_OK);
    ASSERT_EQ(set(image.get(), L"stats:a", variant(1.5)), S_OK);
    ASSERT_EQ(set(image.get(), L"stats:c", variant(int32_t{3})), S_OK);
    text->bstrVal[0] = L'p';
    ASSERT_EQ(get(image.get(), L"stats:b", found), S_OK);
    EXPECT_EQ(std::wstring(found->bstrVal), L"calm");
    ASSERT_EQ(set(image.get(), L"stats:a", variant(2.5)), S_OK);
    ASSERT_EQ(get(image.get(), L"stats:a", found), S_OK);
    EXPECT_EQ(found->dblVal, 2.5);
    for (const wchar_t* other : {L"stats:A", L"stats:", L"stats:aa", L"", L"zzz"}) {
        found = variant(7.0);
        EXPECT_EQ(get(image.get(), other, found), S_FALSE);
        EXPECT_EQ(found.type(), VT_EMPTY);
    }
}

TEST(StatisticsStore, LosesItsKeysWhenPixelsMayHaveChanged)
{
    const auto image = small_image();
    const auto refill = [&] { ASSERT_EQ(set(image.get(), L"key", variant(1.0)), S_OK); };
    refill();
    open_read(image.get());
    EXPECT_TRUE(has(image.get(), L"key")) << "a read lock changes nothing";
    auto lock = open_write(image.get());
    EXPECT_TRUE(has(image.get(), L"key"));
    ASSERT_EQ(lock->Commit(nullptr), S_OK);
    EXPECT_FALSE(has(image.get(), L"key")) << "committed";
    refill();
    lock = nullptr;
    EXPECT_TRUE(has(image.get(), L"key")) << "the commit was the end of the changes";
    open_write(image.get());
    EXPECT_FALSE(has(image.get(), L"key")) << "released without commit";
    refill();
    com_ptr<IPixmat2> copy;
    ASSERT_EQ(image->Clone(copy.put()), S_OK);
    EXPECT_FALSE(has(copy.get(), L"key")) << "statistics do not come along";
}

TEST(StatisticsStore, RefusesNullPointers)
{
    const auto store = small_image().as<IPixmatStatisticsStore>();
    const bstr key(L"key");
    VARIANT value = missing_argument();
    EXPECT_EQ(store->SetValue(nullptr, &value), E_POINTER);
    EXPECT_EQ(store->SetValue(key.get(), nullptr), E_POINTER);
    EXPECT_EQ(store->GetValue(key.get(), nullptr), E_POINTER);
    EXPECT_EQ(store->GetValue(nullptr, &value), E_POINTER);
    EXPECT_EQ(value.vt, VT_EMPTY);
}

TEST(StatisticsStore, StaysAsItIsWhenMemoryRunsOut)
{
    const auto image = small_image();
    const auto store = image.as<IPixmatStatisticsStore>();
    const std::wstring long_text(300, L'k');
    const bstr old_key(L"old"), new_key(long_text);
    const variant text(L"a text that is long");
    ASSERT_EQ(store->SetValue(old_key.get(), text.get()), S_OK);
    for (int i = 1; i < 16; ++i) // all the places that a store has at first
        ASSERT_EQ(store->SetValue(bstr(std::to_wstring(i)).get(), text.get()), S_OK);
    int n = 1;
    for (;; ++n) {
        const HRESULT hr =
            with_failing_allocation(n, [&] { return store->SetValue(new_key.get(), text.get()); });
        if (hr == S_OK) break;
        ASSERT_EQ(hr, E_OUTOFMEMORY) << n;
        ASSERT_FALSE(has(image.get(), long_text.c_str()));
        ASSERT_TRUE(has(image.get(), L"old"));
    }
    EXPECT_GT(n, 3);
    EXPECT_TRUE(has(image.get(), long_text.c_str()));
    variant found;
    EXPECT_EQ(with_failing_allocation(1, [&] { return store->GetValue(old_key.get(), found.put()); }),
              E_OUTOFMEMORY);
    EXPECT_EQ(found.type(), VT_EMPTY);
}

TEST(Events, TellEachSinkOfEachCommitOnItsThread)
{
    const auto image = small_image();
    std::vector<std::string> told;
    const auto told_by = [&](const char* name) {
        return make<listener>([&, name](IPixmat2* changed_image, const rectangle* r) {
            EXPECT_EQ(changed_image, image.get());
            EXPECT_FALSE(has(image.get(), L"key")) << "keys go first";
            told.push_back(name + (r ? std::to_string(r->right) : std::string("all")));
        });
    };
    const auto a = told_by("a"), b = told_by("b");
    ASSERT_EQ(image->StartNotifications(a.get(), PixmatEventMode_AfterCommit), S_OK);
    ASSERT_EQ(image->StartNotifications(b.get(), PixmatEventMode_AfterCommit), S_OK);
    ASSERT_EQ(set(image.get(), L"key", variant(1.0)), S_OK);
    const rectangle part{0, 0, 2, 1};
    EXPECT_EQ(open_write(image.get())->Commit(&part), S_OK);
    EXPECT_EQ(told, (std::vector<std::string>{"a2", "b2"}));
    open_write(image.get()); // not committed
    EXPECT_EQ(open_read(image.get())->Commit(nullptr), E_INVALIDARG);
    EXPECT_EQ(told.size(), 2u);
    ASSERT_EQ(image->StopNotifications(a.get()), S_OK);
    EXPECT_EQ(open_write(image.get())->Commit(nullptr), S_OK);
    EXPECT_EQ(told.back(), "ball");
    EXPECT_EQ(told.size(), 3u);
}

TEST(Events, SinksComeAndGoInsideANotification)
{
    const auto image = small_image();
    int late_calls = 0, own_calls = 0;
    const auto late = make<listener>([&](IPixmat2*, const rectangle*) { ++late_calls; });
    const auto doomed = make<listener>([&](IPixmat2*, const rectangle*) { ADD_FAILURE() << "it had gone"; });
    com_ptr<listener> busy;
    busy = make<listener>([&](IPixmat2* changed, const rectangle*) {
        ++own_calls;
        EXPECT_EQ(changed->StopNotifications(doomed.get()), S_OK);
        EXPECT_EQ(changed->StopNotifications(busy.get()), S_OK);
        EXPECT_EQ(changed->StartNotifications(late.get(), PixmatEventMode_AfterCommit), S_OK);
    });
    ASSERT_EQ(image->StartNotifications(busy.get(), PixmatEventMode_AfterCommit), S_OK);
    ASSERT_EQ(image->StartNotifications(doomed.get(), PixmatEventMode_AfterCommit), S_OK);
    open_write(image.get())->Commit(nullptr);
    EXPECT_EQ(late_calls, 0) << "it waits for the next change";
    open_write(image.get())->Commit(nullptr);
    EXPECT_EQ(late_calls, 1);
    EXPECT_EQ(own_calls, 1);
}

TEST(Events, RefuseWhatIsNoSubscription)
{
    const auto image = small_image();
    const auto sink = make<listener>([](IPixmat2*, const rectangle*) {});
    EXPECT_EQ(image->StartNotifications(nullptr, PixmatEventMode_AfterCommit), E_INVALIDARG);
    for (const int mode : {0, 2, -1})
        EXPECT_EQ(image->StartNotifications(sink.get(), static_cast<PixmatEventMode>(mode)), E_INVALIDARG);
    EXPECT_EQ(image->StopNotifications(sink.get()), E_INVALIDARG);
    EXPECT_EQ(image->StopNotifications(nullptr), E_INVALIDARG);
    EXPECT_EQ(with_failing_allocation(
                  1, [&] { return image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit); }),
              E_OUTOFMEMORY);
    EXPECT_EQ(image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit), S_OK);
    EXPECT_EQ(image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit), E_INVALIDARG);
    EXPECT_EQ(image->StopNotifications(sink.get()), S_OK);
    EXPECT_EQ(image->StopNotifications(sink.get()), E_INVALIDARG);
}

TEST(Events, AreSafeWhileThreadsCommitAndSubscribe)
{
    const auto image = small_image();
    std::atomic<int> calls{0};
    std::vector<std::thread> threads;
    for (int t = 0; t < 4; ++t)
        threads.emplace_back([&] {
            for (int i = 0; i < 100; ++i) {
                const auto sink = make<listener>([&](IPixmat2*, const rectangle*) { ++calls; });
                image->StartNotifications(sink.get(), PixmatEventMode_AfterCommit);
                set(image.get(), L"key", variant(1.0));
                open_write(image.get())->Commit(nullptr);
                image->StopNotifications(sink.get());
            }
        });
    for (auto& t : threads) t.join();
    EXPECT_GE(calls, 400) << "everybody hears of its own changes";
}

} // namespace
} // namespace Qor::Luxar::Test
