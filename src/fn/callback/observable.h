#pragma once

#include "fn/callback/composite.h"
#include "fn/callback/unique_id.h"

/// What a subject shows to those who want to be told of an event. Observers are called on the thread that
/// broadcasts; one may still be called once just after its removal has returned on another thread.
template <class F> class FNObservable {
public:
    virtual ~FNObservable() = default;
    /// @return the id under which the observer can be removed.
    virtual std::string addObserver(const F& observer) const = 0;
    /// Does nothing if the id is not there.
    virtual void removeObserver(const std::string& id) const = 0;
};

/// The subject's side: keeps the observers under ids that are unique in the process.
template <class F> class FNObservableBody : public FNObservable<F> {
public:
    std::string addObserver(const F& observer) const override {
        const std::string id = ids_.generate();
        observers_.add(id, observer);
        return id;
    }
    void removeObserver(const std::string& id) const override { observers_.remove(id); }

protected:
    mutable FNComposite<F> observers_;

private:
    Fn::UniqueId::Generator ids_{Fn::UniqueId::Scope(Fn::UniqueId::Scope::ProcessWide)};
};

/// A subject whose event has the arguments `A...`.
template <class... A> class FNObservableBodyOf : public FNObservableBody<Fn::Functor<void, A...>> {
public:
    /// Calls every observer; one that throws a std::exception is no observer from then on.
    void broadcast(const A&... args) const {
        this->observers_.forEach([&](const Fn::Functor<void, A...>& observer) { observer(args...); });
    }
};
template <class A> using FNObservableBody1 = FNObservableBodyOf<A>;
template <class A, class B> using FNObservableBody2 = FNObservableBodyOf<A, B>;
