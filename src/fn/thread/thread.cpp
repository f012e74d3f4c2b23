#include "fn/thread/thread.h"

#include "fn/message/dialog.h"
#include "fn/thread/thread_impl.h"

#include <cerrno>
#include <climits>
#include <memory>

#include <fcntl.h>
#include <poll.h>
#include <unistd.h>

namespace {

constexpr std::size_t stackSize = 2097152;

thread_local FNThreadImpl* currentImpl = nullptr;

class Attributes {
public:
    Attributes() { pthread_attr_init(&attributes); }
    ~Attributes() { pthread_attr_destroy(&attributes); }
    Attributes(const Attributes&) = delete;
    Attributes& operator=(const Attributes&) = delete;
    pthread_attr_t attributes;
};

void setStackSize(pthread_attr_t& attributes) {
    const int code = pthread_attr_setstacksize(&attributes, stackSize);
    if (code == EINVAL)
        FNDialog::error(
            "The value of stacksize is less than {PTHREAD_STACK_MIN} or exceeds a system-imposed limit");
    else if (code)
        FNDialog::error("Unexpected error setting thread stack size");
}

const char* createFailure(int code) {
    switch (code) {
    case ENOMEM:
        return "Not enough memory available to create the new thread.";
    case EAGAIN:
        return "System limit is exceeded: too many LWPs were created.";
    case EINVAL:
        return "stack base is not NULL and stack_size is less than the value returned by thr_min_stack() or "
               "stack_base i...";
    default:
        return "unexpected error creating thread";
    }
}

} // namespace

FNThreadManagerSingleton& FNThreadManager() {
    // Never destroyed: threads of static objects may end after any static of ours.
    static auto& manager = *new FNThreadManagerSingleton;
    static const struct Reporter {
        ~Reporter() { manager.reportLeft(); }
    } reporter;
    return manager;
}

int FNThreadManagerSingleton::enter(FNThreadImpl* thread) {
    const FNMutexLock lock(mutex_);
    threads_.push_back(thread);
    return ++lastId_;
}

void FNThreadManagerSingleton::remove(FNThreadImpl* thread) {
    const FNMutexLock lock(mutex_);
    threads_.remove(thread);
}

void FNThreadManagerSingleton::reportLeft() const {
    const FNMutexLock lock(mutex_);
    for (const FNThreadImpl* thread : threads_)
        FNDialog::warn("FNThreadManager: thread " + thread->state().name + " is still referenced");
}

FNThreadImpl::FNThreadImpl(const Fn::Functor0& job, const std::string& name)
    : id_(FNThreadManager().enter(this)), name_(name), cancelMutex_(FNMutex::recursive), job_(job) {
    if (pipe2(pipe_, O_CLOEXEC) != 0) {
        const char* const reason = errno == EMFILE ? "EMFILE" : "ENFILE";
        FNThreadManager().remove(this);
        FN_THROW(FNESysError, "Error creating thread {" + name_ + "," + std::to_string(id_) +
                                  "}: Failed to create pipes for thread canceling: " + reason);
    }
}

FNCountedPtr<FNThreadImpl> FNThreadImpl::adopted() {
    const bool isMain = getpid() == gettid();
    FNCountedPtr<FNThreadImpl> impl(new FNThreadImpl({}, isMain ? "MainThread" : "ForeignThread"));
    FNThreadManager().remove(impl.get()); // lasts as long as its thread; nobody has to let go of it
    impl->state_ = FNThreadState::running;
    impl->mine_ = false;
    impl->thread_ = pthread_self();
    return impl;
}

FNThreadImpl::~FNThreadImpl() {
    FNThreadManager().remove(this);
    if (mine_ && state_ != FNThreadState::created) {
        // The launcher holds a handle, so a thread cannot be running here; it may be about to return.
        if (state_ == FNThreadState::running)
            FNDialog::error("fatal error: thread should not be removed while running");
        if (!joined_) {
            if (pthread_equal(thread_, pthread_self()))
                pthread_detach(thread_);
            else
                pthread_join(thread_, nullptr);
        }
    }
    close(pipe_[0]);
    close(pipe_[1]);
}

/// What the new thread is handed. The handle keeps the body alive to the thread's very end.
struct FNThreadImpl::Launch {
    FNCountedPtr<FNThreadImpl> impl;
    FNEvent started;
};

void FNThreadImpl::start(const FNCountedPtr<FNThreadImpl>& self) {
    const FNMutexLock lock(FNThreadManager().mutex());
    if (self->state_ != FNThreadState::created) FN_THROW(FNThread::InvalidState, "starting thread");

    Attributes attributes;
    setStackSize(attributes.attributes);
    const FNEvent started;
    std::unique_ptr<Launch> launch(new Launch{self, started});
    if (const int code = pthread_create(&self->thread_, &attributes.attributes, &launched, launch.get()))
        FN_THROW(FNESysError, createFailure(code));
    launch.release();
    const FNThreadSelf::CancelDisabled notHere; // the thread runs already, so this call has to succeed
    started.wait();
}

void* FNThreadImpl::launched(void* argument) {
    const std::unique_ptr<Launch> launch(static_cast<Launch*>(argument));
    currentImpl = launch->impl.get();
    launch->impl->launch(launch->started);
    return nullptr;
}

void FNThreadImpl::launch(const FNEvent& started) {
    try {
        // The starter holds the manager's mutex, and waits: this is the one change of state without it.
        state_ = FNThreadState::running;
        const FNThreadState now{state_, id_, message_, name_};
        started.signal();
        if (pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, nullptr) != 0 ||
            pthread_setcanceltype(PTHREAD_CANCEL_DEFERRED, nullptr) != 0)
            FN_THROW(FNESysError, "setting cancel state");
        broadcast(now);
        run();
    } catch (const std::exception& e) {
        FNDialog::error("FNThreadImpl::launch[" + name_ + "] error:" + e.what());
        setState(FNThreadState::failed, e.what());
    }
    try {
        broadcastState();
    } catch (const std::exception& e) {
        FNDialog::error(std::string("threadlauncher: broadcast: ") + e.what());
    }
}

void FNThreadImpl::run() {
    try {
        job_();
        setState(FNThreadState::ended, "Returned.");
    } catch (const ExitException&) {
        setState(FNThreadState::ended, "Cancelled.");
    } catch (const std::exception& e) {
        setState(FNThreadState::failed, e.what());
    } catch (...) {
        if (!std::current_exception()) throw; // terminate() unwinds the stack, and must not be stopped
        setState(FNThreadState::failed, "Unknown exception.");
    }
}

void FNThreadImpl::join() {
    FNMutexLock lock(FNThreadManager().mutex());
    if (state_ == FNThreadState::created) FN_THROW(FNThread::InvalidState, "joining a non-started thread");
    if (joined_ && state_ != FNThreadState::running) return;
    const pthread_t thread = thread_;
    const bool self = pthread_equal(thread, pthread_self()); // refused, and leaves the join to others
    const bool alreadyJoined = !self && std::exchange(joined_, true);
    lock.release();

    const int code = self ? EDEADLK : alreadyJoined ? EINVAL : pthread_join(thread, nullptr);
    switch (code) {
    case 0:
        return;
    case EDEADLK:
        FN_THROW(FNEBadArg,
                 "FNThread::join: A deadlock was detected or the value of target thread specifies the "
                 "calling thread");
    case EINVAL:
        FN_THROW(FNEBadArg, "Another thread already joins thread id " + std::to_string(id_) +
                                " or it has been detached.");
    case ESRCH:
        if (state().state >= FNThreadState::failed) return;
        FN_THROW(FNEBadArg, "No undetached thread could be found for this id");
    default:
        FN_THROW(FNEBadArg, "FNThread::join: Unexpected returned error " + std::to_string(code));
    }
}

void FNThreadImpl::requestCancel() {
    const FNMutexLock lock(cancelMutex_);
    if (cancelRequested_) return;
    cancelRequested_ = true;
    if (write(pipe_[1], "x", 1) != 1) FN_THROW(FNESysError, "Failed to write to pipe");
}

void FNThreadImpl::terminate() {
    {
        const FNMutexLock lock(FNThreadManager().mutex());
        if (state_ == FNThreadState::running) pthread_cancel(thread_);
    }
    join();
    {
        const FNMutexLock lock(FNThreadManager().mutex());
        if (state_ == FNThreadState::running) setState(FNThreadState::ended, "Cancelled.");
    }
    broadcastState();
}

FNThreadState FNThreadImpl::state() const {
    const FNMutexLock lock(FNThreadManager().mutex());
    return {state_, id_, message_, name_};
}

void FNThreadImpl::setState(FNThreadState::State state, const std::string& message) {
    const FNMutexLock lock(FNThreadManager().mutex());
    state_ = state;
    message_ = message;
}

void FNThreadImpl::broadcastState() const {
    broadcast(state());
}

bool FNThreadImpl::cancelPending() const {
    const FNMutexLock lock(cancelMutex_);
    return cancelRequested_ && !cancelDisabled_;
}

void FNThreadImpl::serviceCancel() {
    if (cancelPending()) throw ExitException();
}

void FNThreadImpl::sleep(unsigned long milliseconds) {
    serviceCancel();
    pollfd wake{pipe_[0], POLLIN, 0};
    {
        const FNMutexLock lock(cancelMutex_);
        if (cancelDisabled_) wake.fd = -1; // poll skips it
    }
    poll(&wake, 1, milliseconds > INT_MAX ? INT_MAX : static_cast<int>(milliseconds));
    serviceCancel();
}

bool FNThreadImpl::setCancelDisabled(bool disabled) {
    const FNMutexLock lock(cancelMutex_);
    return std::exchange(cancelDisabled_, disabled);
}

FNThread::FNThread(const Fn::Functor0& job, const std::string& name) : impl_(new FNThreadImpl(job, name)) {}
FNThread::FNThread(const FNThread&) = default;
FNThread& FNThread::operator=(const FNThread&) = default;
FNThread::~FNThread() = default;
void FNThread::start() const {
    FNThreadImpl::start(impl_);
}
FNThreadState FNThread::state() const {
    return impl_->state();
}
void FNThread::join() const {
    impl_->join();
}
void FNThread::requestCancel() const {
    impl_->requestCancel();
}
void FNThread::terminate() const {
    impl_->terminate();
}
std::string FNThread::addObserver(const Fn::Functor1<FNThreadState>& observer) const {
    return impl_->addObserver(observer);
}
void FNThread::removeObserver(const std::string& id) const {
    impl_->removeObserver(id);
}

namespace {

/// The body of the calling thread, made at first use for a thread of the application.
FNThreadImpl& self() {
    if (!currentImpl) {
        thread_local FNCountedPtr<FNThreadImpl> adopted = FNThreadImpl::adopted();
        thread_local const struct Forget {
            ~Forget() { currentImpl = nullptr; }
        } forget;
        currentImpl = adopted.get();
    }
    return *currentImpl;
}

} // namespace

FNThreadState FNThreadSelf::state() {
    return self().state();
}
int FNThreadSelf::cancelDescriptor() {
    return self().cancelDescriptor();
}

void FNThreadSelf::serviceCancel() {
    if (currentImpl) currentImpl->serviceCancel(); // nobody can have asked a thread without a body to stop
}

void FNThreadSelf::sleep(unsigned long milliseconds) {
    self().sleep(milliseconds);
}
void FNThreadSelf::exit() {
    throw FNThreadImpl::ExitException();
}

FNThreadSelf::CancelDisabled::CancelDisabled() : before_(self().setCancelDisabled(true)) {}
FNThreadSelf::CancelDisabled::~CancelDisabled() {
    self().setCancelDisabled(before_);
}
