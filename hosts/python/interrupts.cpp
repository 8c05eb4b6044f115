#include "interrupts.h"

#include <csignal>
#include <unistd.h>

namespace python {
namespace {

using ZELT::IFilters2;
using ZELT::IZELT2;

/// Whom to ask; made at the first watch and never released.
struct cancellation {
    IZELT2* root = nullptr;
    IFilters2* filters = nullptr;
    IPixmat2* pixel = nullptr;
};
cancellation target;

// Touched by the main thread and by signal handlers.
struct sigaction python_action;
volatile std::sig_atomic_t watching = 0;
volatile std::sig_atomic_t interrupted = 0;

bool prepare() noexcept
{
    if (target.pixel) return true;
    try {
        com_ptr<IZELT2> root = zelt::create<IZELT2>("ZELT.Main2");
        com_ptr<IFilters2> filters = zelt::get(root, &IZELT2::get_Filters);
        com_ptr<IPixmat2> pixel = zelt::new_image(1, 1, 8);
        target = {root.detach(), filters.detach(), pixel.detach()};
        return true;
    } catch (...) {
        return false; // without it the interrupt waits for the end of the call
    }
}

/// Both things that happen here are stores to atomic variables.
void on_interrupt(int number, siginfo_t* info, void* context)
{
    interrupted = 1;
    target.root->Cancel();
    if (python_action.sa_flags & SA_SIGINFO)
        python_action.sa_sigaction(number, info, context);
    else
        python_action.sa_handler(number);
}

/// A request that came too late for its call would stop the next one. The smallest call that can be cancelled takes it.
void take_back_request() noexcept
{
    try {
        const SAFEARRAYBOUND bounds[2] = {{1, 0}, {1, 0}};
        variant kernel;
        kernel.get()->parray = SafeArrayCreate(VT_R8, 2, bounds);
        if (!kernel->parray) return;
        kernel.get()->vt = VT_ARRAY | VT_R8;
        com_ptr<IPixmat2> unused;
        target.filters->Convolve(target.pixel, *kernel.get(), 0, 0, nullptr, unused.put());
        SetErrorInfo(0, nullptr);
    } catch (...) {
    }
}

bool is_main_thread() noexcept { return gettid() == getpid(); }

bool has_handler(const struct sigaction& action)
{
    return (action.sa_flags & SA_SIGINFO) || (action.sa_handler != SIG_DFL && action.sa_handler != SIG_IGN);
}

} // namespace

bool can_be_cancelled(const interface_info& table)
{
    return table.id == IFilters2::iid || table.id == ZELT::IFilters::iid;
}

interrupt_watch::interrupt_watch(bool wanted) noexcept : watching_(false)
{
    if (!wanted || watching || !is_main_thread() || !prepare()) return;
    struct sigaction action = {};
    action.sa_sigaction = on_interrupt;
    action.sa_flags = SA_SIGINFO | SA_ONSTACK;
    sigemptyset(&action.sa_mask);
    if (sigaction(SIGINT, nullptr, &python_action) != 0 || !has_handler(python_action)) return;
    interrupted = 0;
    watching = 1;
    watching_ = sigaction(SIGINT, &action, nullptr) == 0;
    if (!watching_) watching = 0;
}

interrupt_watch::~interrupt_watch() { end(); }

bool interrupt_watch::end() noexcept
{
    if (!watching_) return false;
    watching_ = false;
    sigaction(SIGINT, &python_action, nullptr);
    watching = 0;
    if (!interrupted) return false;
    take_back_request();
    return true;
}

} // namespace python
