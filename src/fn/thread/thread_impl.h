#pragma once

#include "fn/thread/event.h"
#include "fn/thread/mutex.h"
#include "fn/thread/thread.h"

#include <list>

#include <pthread.h>

/// The body behind FNThread and FNThreadSelf.
class FNThreadImpl final : public FNObservableBody1<FNThreadState> {
public:
    /// Unwinds a thread to its launcher. Not a std::exception, so that no handler for failures takes it.
    class ExitException {};

    FNThreadImpl(const Fn::Functor0& job, const std::string& name);
    /// For a thread that runs already and was not made here.
    static FNCountedPtr<FNThreadImpl> adopted();
    ~FNThreadImpl() override;

    static void start(const FNCountedPtr<FNThreadImpl>& self);
    void join();
    void requestCancel();
    void terminate();
    FNThreadState state() const;

    void serviceCancel();
    void sleep(unsigned long milliseconds);
    int cancelDescriptor() const noexcept { return pipe_[0]; }
    /// @return the former value.
    bool setCancelDisabled(bool disabled);

private:
    struct Launch;
    static void* launched(void* launch);
    void launch(const FNEvent& started);
    void run();
    void setState(FNThreadState::State state, const std::string& message);
    void broadcastState() const;
    bool cancelPending() const;

    FNThreadState::State state_ = FNThreadState::created;
    int id_;
    std::string message_;
    std::string name_;
    bool joined_ = false;
    bool mine_ = true; ///< made here, so joined or detached here
    pthread_t thread_{};
    int pipe_[2] = {-1, -1};
    FNMutex cancelMutex_;
    bool cancelRequested_ = false;
    bool cancelDisabled_ = false;
    Fn::Functor0 job_;
};

/// All threads of the process that the library knows.
class FNThreadManagerSingleton {
public:
    /// Guards the state of every thread.
    const FNMutex& mutex() const noexcept { return mutex_; }
    int enter(FNThreadImpl* thread);
    void remove(FNThreadImpl* thread);
    /// Reports each thread that was made here and is still there.
    void reportLeft() const;

private:
    FNMutex mutex_{FNMutex::recursive};
    std::list<FNThreadImpl*> threads_;
    int lastId_ = 0;
};

FNThreadManagerSingleton& FNThreadManager();
