#include "runtime/threads/Thread.h"

#include "runtime/base/Assert.h"
#include "runtime/log/Shielded.h"
#include "runtime/threads/Thread_Context.h"

#include <cerrno>
#include <csignal>
#include <memory>
#include <new>
#include <utility>

namespace cimple
{

namespace
{

/// What the creator hands to the new thread.
struct Thread_Start
{
    Thread::Proc proc;
    void* arg;
    std::unique_ptr<Thread_Context> context; ///< null when the creator has none
};

/// The context of a provider thread, for its life. The destructor also runs when Thread::exit() unwinds.
class Attachment
{
public:
    explicit Attachment(std::unique_ptr<Thread_Context> context) : _context(std::move(context))
    {
        const auto attach = [this]
        {
            Thread_Context::push(_context.get());
            _pushed = true;
            _context->thread_start_hook();
            return true;
        };
        if (_context && !shielded(false, attach))
            end();
    }
    ~Attachment() { end(); }
    Attachment(const Attachment&) = delete;
    Attachment& operator=(const Attachment&) = delete;
    /// Null for a thread that has none or could not be attached: its up-calls fail without effect.
    Thread_Context* context() const { return _context.get(); }

private:
    void end()
    {
        if (std::exchange(_pushed, false))
            Thread_Context::pop();
        _context.reset();
    }

    std::unique_ptr<Thread_Context> _context;
    bool _pushed = false;
};

void run_exit_hook(Thread_Context& context)
{
    const auto hook = [&] { return context.thread_exit_hook(), true; };
    shielded(false, hook);
}

} // namespace

static void* _thread_proc(void* arg)
{
    std::unique_ptr<Thread_Start> start(static_cast<Thread_Start*>(arg));
    const Thread::Proc proc = start->proc;
    void* const proc_arg = start->arg;
    const Attachment attachment(std::move(start->context));
    start.reset();

    // An exception ends the thread's work and not the process.
    void* value = shielded(static_cast<void*>(nullptr), [&] { return proc(proc_arg); });
    if (Thread_Context* const context = attachment.context())
    {
        run_exit_hook(*context);
        CIMPLE_ASSERT(context == Thread_Context::top());
    }
    return value;
}

namespace
{

/// Blocks for a scope what a thread started in it shall not take: the signals of the host. Those that a thread's own
/// fault raises stay open.
class Host_Signals_Blocked
{
public:
    Host_Signals_Blocked()
    {
        sigset_t blocked;
        sigfillset(&blocked);
        for (int own : {SIGSEGV, SIGBUS, SIGFPE, SIGILL, SIGTRAP, SIGSYS, SIGABRT})
            sigdelset(&blocked, own);
        pthread_sigmask(SIG_SETMASK, &blocked, &_former);
    }
    ~Host_Signals_Blocked() { pthread_sigmask(SIG_SETMASK, &_former, nullptr); }
    Host_Signals_Blocked(const Host_Signals_Blocked&) = delete;
    Host_Signals_Blocked& operator=(const Host_Signals_Blocked&) = delete;

private:
    sigset_t _former;
};

/// The record of a thread that the caller starts, or the error that pthread_create would give.
int make_start(Thread::Proc proc, void* arg, std::unique_ptr<Thread_Start>& start)
{
    start.reset(new (std::nothrow) Thread_Start{proc, arg, nullptr});
    if (!start)
        return ENOMEM;
    // The creator's context is valid here and now, so the broker is asked for the new one before the thread runs.
    Thread_Context* const creator = Thread_Context::top();
    if (!creator)
        return 0;
    const auto ask = [&] { return start->context.reset(creator->thread_create_hook(arg)), true; };
    if (!shielded(false, ask))
        return ENOMEM;
    return start->context ? 0 : EAGAIN; // without a way to the broker it would see another world than its creator
}

int create_thread(pthread_t& handle, int detach_state, Thread::Proc proc, void* arg)
{
    std::unique_ptr<Thread_Start> start;
    if (const int error = make_start(proc, arg, start))
        return error;
    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setdetachstate(&attributes, detach_state);
    const Host_Signals_Blocked signals;
    const int error = pthread_create(&handle, &attributes, _thread_proc, start.get());
    pthread_attr_destroy(&attributes);
    if (error == 0)
        static_cast<void>(start.release()); // the thread's from now on
    return error;
}

} // namespace

int Thread::create_joinable(Thread& thread, Proc proc, void* arg)
{
    return create_thread(thread._handle, PTHREAD_CREATE_JOINABLE, proc, arg);
}

int Thread::create_detached(Thread& thread, Proc proc, void* arg)
{
    return create_thread(thread._handle, PTHREAD_CREATE_DETACHED, proc, arg);
}

int Thread::join(Thread& thread, void*& value)
{
    value = nullptr;
    return pthread_join(thread._handle, &value);
}

void Thread::exit(void* value)
{
    if (Thread_Context* context = Thread_Context::top())
        run_exit_hook(*context);
    pthread_exit(value);
}

Thread Thread::self()
{
    Thread thread;
    thread._handle = pthread_self();
    return thread;
}

} // namespace cimple
