#include "runtime/Thread.h"

#include "runtime/Assert.h"
#include "runtime/Thread_Context.h"

#include <memory>

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
        Thread_Context::push(_context.get());
        _context->thread_start_hook();
    }
    ~Attachment() { Thread_Context::pop(); }
    Attachment(const Attachment&) = delete;
    Attachment& operator=(const Attachment&) = delete;
    Thread_Context* context() const { return _context.get(); }

private:
    std::unique_ptr<Thread_Context> _context;
};

} // namespace

static void* _thread_proc(void* arg)
{
    std::unique_ptr<Thread_Start> start(static_cast<Thread_Start*>(arg));
    const Thread::Proc proc = start->proc;
    void* const proc_arg = start->arg;
    std::unique_ptr<Thread_Context> own = std::move(start->context);
    start.reset();
    if (!own)
        return proc(proc_arg);

    const Attachment attachment(std::move(own));
    void* value = proc(proc_arg);
    Thread_Context* const context = attachment.context();
    context->thread_exit_hook();
    CIMPLE_ASSERT(context == Thread_Context::top());
    return value;
}

namespace
{

int create_thread(pthread_t& handle, int detach_state, Thread::Proc proc, void* arg)
{
    auto start = std::make_unique<Thread_Start>(Thread_Start{proc, arg, nullptr});
    // The creator's context is valid here and now, so the broker is asked for the new one before the thread runs.
    if (Thread_Context* context = Thread_Context::top())
        start->context.reset(context->thread_create_hook(arg));

    pthread_attr_t attributes;
    pthread_attr_init(&attributes);
    pthread_attr_setdetachstate(&attributes, detach_state);
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
        context->thread_exit_hook();
    pthread_exit(value);
}

Thread Thread::self()
{
    Thread thread;
    thread._handle = pthread_self();
    return thread;
}

} // namespace cimple
