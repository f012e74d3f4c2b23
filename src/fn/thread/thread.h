#pragma once

#include "fn/callback/functor.h"
#include "fn/callback/observable.h"

#include <string>

class FNThreadImpl;

/// A moment's state of a thread.
struct FNThreadState {
    enum State { created = 0, running = 1, failed = 2, ended = 3 };

    int state = created;
    int id = 0;
    std::string message; ///< how it ended: "Returned.", "Cancelled.", or the text of the exception
    std::string name;
};

/// Handle on a thread with cooperative cancellation.
///
///     FNThread thread = FNSpawn([] { work(); }, "worker");
///     thread.start();
///     thread.requestCancel();    // it stops at its next cancellation point
///     thread.join();
///
/// Cancellation points are FNThreadSelf::serviceCancel and sleep, and FNEvent::wait. The stack has 2097152
/// bytes.
class FNThread {
public:
    /// start() or join() in the wrong state.
    class InvalidState : public FNEBadFunCall {
    public:
        static constexpr const char* thisTypeId = "FNThread::InvalidState";
        using FNEBadFunCall::FNEBadFunCall;
    };

    explicit FNThread(const Fn::Functor0& job, const std::string& name = {});
    FNThread(const FNThread&);
    FNThread& operator=(const FNThread&);
    ~FNThread();

    /// The thread is running when this returns. @throws InvalidState if it was started before; FNESysError
    void start() const;
    FNThreadState state() const;
    /// Waits for the end. @throws InvalidState if it was never started; FNEBadArg
    void join() const;
    /// Asks the thread to stop at its next cancellation point.
    void requestCancel() const;
    /// Stops the thread wherever it can be stopped, and joins it. What it held is not given back.
    void terminate() const;

    /// Observers are told of each change of state, on the thread that makes it.
    std::string addObserver(const Fn::Functor1<FNThreadState>& observer) const;
    void removeObserver(const std::string& id) const;

    bool operator==(const FNThread&) const = default;

private:
    FNCountedPtr<FNThreadImpl> impl_;
};

/// The calling thread, also one that was not made here.
class FNThreadSelf {
public:
    static FNThreadState state();
    /// Readable once cancellation is requested: for a set of descriptors that the thread waits on.
    static int cancelDescriptor();

    /// The cancellation point: leaves the thread if its cancellation is requested.
    static void serviceCancel();
    /// Cancellation point, waits (a request ends the wait early), cancellation point.
    static void sleep(unsigned long milliseconds);
    /// Leaves the thread; its state becomes "ended".
    [[noreturn]] static void exit();

    /// While one of these lives, cancellation points of this thread do nothing.
    class CancelDisabled {
    public:
        CancelDisabled();
        ~CancelDisabled();
        CancelDisabled(const CancelDisabled&) = delete;
        CancelDisabled& operator=(const CancelDisabled&) = delete;

    private:
        bool before_;
    };
};

/// A thread for a job; it is not started.
inline FNThread FNSpawn(const Fn::Functor0& job, const std::string& name = {}) {
    return FNThread(job, name);
}

/// A thread for a member of an object (or of what a counted handle holds, which then stays alive).
template <class C, class M, class... Bound>
FNThread FNSpawnNamedMember(const std::string& name, C& object, M member, const Bound&... bound) {
    return FNThread(Fn::Functor0::callee(object, member, bound...), name);
}
template <class C, class M, class... Bound>
FNThread FNSpawnMember(C& object, M member, const Bound&... bound) {
    return FNSpawnNamedMember({}, object, member, bound...);
}
