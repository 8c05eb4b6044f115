#include "frame/errors.h"
#include "frame/exception_translator.h"
#include "frame/operation.h"
#include "support/failing_new.h"
#include "support/failures.h"

#include <functional>
#include <thread>

namespace Qor::Luxar::ZELT::Test {
namespace {

enum class kernel_colour { red, green };
enum script_colour : int32_t { script_red = 0, script_green = 1 };

} // namespace
} // namespace Qor::Luxar::ZELT::Test

template <>
struct Qor::enumeration_of<Qor::Luxar::ZELT::Test::script_colour> {
    static constexpr enumeration_value values[] = {{"red", 0}, {"green", 1}};
    static constexpr enumeration_info info{"script_colour", values};
};

namespace Qor::Luxar::ZELT::Test {
namespace {

struct thrown_case {
    const char* name;
    std::function<void()> raise;
    uint32_t code;
    const wchar_t* description;
};

TEST(Translation, GivesEachExceptionItsCodeAndText)
{
    com_ptr<ICreateErrorInfo> made;
    ASSERT_EQ(CreateErrorInfo(made.put()), S_OK);
    made->SetDescription(L"from the object");
    const com_ptr<IErrorInfo> object = made.as<IErrorInfo>();
    const thrown_case cases[] = {
        {"exception", [] { throw std::runtime_error("SWITCH"); }, 0x80004005, L"SWITCH"},
        {"logic", [] { throw std::logic_error("logic"); }, 0x80004005, L"logic"},
        {"cast", [] { throw std::bad_cast(); }, 0x80070057, L"std::bad_cast"},
        {"argument", [] { throw std::invalid_argument("null IPixmat2"); }, 0x80070057, L"null IPixmat2"},
        {"range", [] { throw std::out_of_range("far"); }, 0x80070057, L"far"},
        {"memory", [] { throw std::bad_alloc(); }, 0x8007000E, L"bad allocation"},
        {"object", [&] { throw com_error(E_ACCESSDENIED, object); }, 0x80070005, L"from the object"},
        {"no object", [] { throw com_error(E_ACCESSDENIED); }, 0x80070005, L""},
        {"result", [] { throw HResultException(E_POINTER, "text"); }, 0x80004003, L"text"},
        {"code object", [] { throw code_error(E_NOTIMPL); }, 0x80004001, L""},
        {"plain code", [] { throw HRESULT{E_NOINTERFACE}; }, 0x80004002, L""},
        {"system 5", [] { throw win32_error(5, "system"); }, 0x80070005, L"system"},
        {"system 0", [] { throw win32_error(0, "none"); }, 0, L"none"},
        {"system below 0", [] { throw win32_error(-7, "low"); }, 0xFFFFFFF9, L"low"},
        {"system large", [] { throw win32_error(0x12345, "large"); }, 0x80072345, L"large"},
        {"other", [] { throw "text"; }, 0x8000FFFF, L""},
    };
    for (const thrown_case& c : cases) {
        SetErrorInfo(0, nullptr);
        const HRESULT hr = run_frame(IPixmat2::iid, [&]() -> HRESULT {
            c.raise();
            return S_FALSE;
        });
        EXPECT_EQ(static_cast<uint32_t>(hr), c.code) << c.name;
        const left_behind left = take_error();
        EXPECT_EQ(left.description, c.description) << c.name;
        EXPECT_EQ(left.source, L"") << c.name;
        EXPECT_EQ(left.interface_id, IPixmat2::iid) << c.name;
    }
}

TEST(Translation, SpellsTheBadEnumeration)
{
    EXPECT_EQ(enum_cast<kernel_colour>(script_green), kernel_colour::green);
    expect_fails(E_INVALIDARG,
                 L"bad_enum_cast: enum_cast<Qor::Luxar::ZELT::Test::(anonymous namespace)::kernel_colour>("
                 L"Qor::Luxar::ZELT::Test::(anonymous namespace)::script_colour(7))",
                 [] {
                     return run_frame(IPixmat2::iid, [] {
                         enum_cast<kernel_colour>(static_cast<script_colour>(7));
                         return S_OK;
                     });
                 });
}

TEST(Translation, TextHasCodeMeaningDescriptionAndSource)
{
    EXPECT_STREQ(HResultException(E_INVALIDARG, L"ZELT.Main", L"too wide", L"", 0).what(),
                 "HRESULT 80070057: invalid argument: too wide\nSource: ZELT.Main");
    EXPECT_STREQ(HResultException(make_hresult(0x8abcdef1)).what(), "HRESULT 8ABCDEF1");
}

TEST(Translation, CheckKeepsGivenTextsAndFillsTheRest)
{
    ReportError(GUID_NULL, L"from the thread", IPixmat2::iid, E_FAIL);
    try {
        CheckHResult(E_ACCESSDENIED, L"given");
        FAIL() << "accepted a failure";
    } catch (const HResultException& e) {
        EXPECT_EQ(e.description, L"given");
    }
    ReportError(GUID_NULL, L"from the thread", IPixmat2::iid, E_FAIL);
    try {
        CheckHResult{E_ACCESSDENIED};
        FAIL() << "accepted a failure";
    } catch (const HResultException& e) {
        EXPECT_EQ(e.hresult, E_ACCESSDENIED);
        EXPECT_EQ(e.description, L"from the thread");
    }
    EXPECT_NO_THROW(CheckHResult{S_FALSE});
}

TEST(Translation, KeepsTheCodeWhenNoTextCanBeMade)
{
    const std::string text = "a text too long for a string to keep inside itself";
    const struct {
        std::exception_ptr failure; // made before memory runs out
        HRESULT code;
    } cases[] = {
        {std::make_exception_ptr(std::invalid_argument(text)), E_INVALIDARG},
        {std::make_exception_ptr(HResultException(E_ACCESSDENIED, text)), E_ACCESSDENIED},
        {std::make_exception_ptr(std::bad_alloc()), E_OUTOFMEMORY},
    };
    for (const auto& c : cases) {
        bool reached = true;
        for (int n = 1; reached; ++n) {
            ASSERT_LT(n, 100);
            const failing_allocation armed(n);
            const HRESULT hr =
                run_frame(IPixmat2::iid, [&]() -> HRESULT { std::rethrow_exception(c.failure); });
            reached = armed.happened();
            EXPECT_EQ(hr, c.code) << "allocation " << n;
        }
    }
}

TEST(Translation, KeepsErrorInformationPerThread)
{
    SetErrorInfo(0, nullptr);
    std::thread([] { ReportError(GUID_NULL, L"elsewhere", IPixmat2::iid, E_FAIL); }).join();
    EXPECT_EQ(take_error().description, L"");
}

} // namespace
} // namespace Qor::Luxar::ZELT::Test
