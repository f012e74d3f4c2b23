#pragma once

#include "fn/cptr.h"

#include <concepts>
#include <functional>
#include <tuple>
#include <type_traits>
#include <utility>

/// Functors: callables as values. A functor is a counted handle on a body; copies share the body.
///
///     Fn::Functor1<int> print([](const int& i) { std::cout << i; });
///     auto changed = Fn::Functor1<int>::callee(model, &Model::changed, "source");   // model.changed(i,
///     "source") changed(7);
///
/// A functor made by callee() of a plain object leaves the object's lifetime alone: its owner removes the
/// observer, or outlives the functor. One made by callee() of a counted handle keeps the object alive.

namespace Fn {

template <class T> inline constexpr bool isCountedPtr = false;
template <class T> inline constexpr bool isCountedPtr<FNCountedPtr<T>> = true;

template <class R, class... A> class Functor {
public:
    class Body {
    public:
        virtual ~Body() = default;
        virtual R operator()(const A&... args) = 0;
    };

    /// Does nothing; returns the stored result.
    class Nil final : public Body {
    public:
        Nil() = default;
        template <class T>
        requires std::convertible_to<T, R>
        explicit Nil(const T& result) : result_(result) {}
        R operator()(const A&...) override {
            if constexpr (!std::is_void_v<R>) return result_;
        }

    private:
        struct Nothing {};
        [[no_unique_address]] std::conditional_t<std::is_void_v<R>, Nothing, R> result_{};
    };

    /// Calls a member of an object that somebody else owns, call arguments first, bound arguments behind
    /// them.
    template <class C, class M, class... Bound> class CalleeRef final : public Body {
    public:
        CalleeRef(C* object, M member, const Bound&... bound)
            : object_(object), member_(member), bound_(bound...) {}
        R operator()(const A&... args) override {
            return std::apply(
                [&](const Bound&... bound) { return R(std::invoke(member_, *object_, args..., bound...)); },
                bound_);
        }

    private:
        C* object_;
        M member_;
        std::tuple<Bound...> bound_;
    };

    /// As CalleeRef, on an object that the handle `P` keeps alive.
    template <class P, class M, class... Bound> class CalleePointer final : public Body {
    public:
        CalleePointer(const P& object, M member, const Bound&... bound)
            : object_(object), call_(object.get(), member, bound...) {}
        R operator()(const A&... args) override { return call_(args...); }

    private:
        using C = std::remove_pointer_t<decltype(std::declval<P>().get())>;
        P object_;
        CalleeRef<C, M, Bound...> call_;
    };

    /// As CalleeRef, on a copy of the object.
    template <class C, class M> class CalleeValue final : public Body {
    public:
        CalleeValue(const C& object, M member) : object_(object), member_(member) {}
        R operator()(const A&... args) override { return R(std::invoke(member_, object_, args...)); }

    private:
        C object_;
        M member_;
    };

    /// Calls a function (or any callable), call arguments first, bound arguments behind them.
    template <class F, class... Bound> class Fnct final : public Body {
    public:
        explicit Fnct(F function, const Bound&... bound) : function_(std::move(function)), bound_(bound...) {}
        R operator()(const A&... args) override {
            return std::apply(
                [&](const Bound&... bound) { return R(std::invoke(function_, args..., bound...)); }, bound_);
        }

    private:
        F function_;
        std::tuple<Bound...> bound_;
    };

    /// A functor that can be called and does nothing.
    Functor() : body_(new Nil) {}
    /// Takes ownership of `body`, which is not null.
    explicit Functor(Body* body) : body_(body) {}
    /// Any callable that accepts the call's arguments.
    template <class F>
    requires(std::is_invocable_r_v<R, F&, const A&...> && !std::derived_from<std::remove_cvref_t<F>, Functor>)
        Functor(F function)
        : body_(new Fnct<F>(std::move(function))) {}

    template <class C, class M, class... Bound>
    requires(!isCountedPtr<std::remove_const_t<C>>) static Functor
        callee(C& object, M member, const Bound&... bound) {
        return Functor(new CalleeRef<C, M, Bound...>(&object, member, bound...));
    }
    template <class C, class M, class... Bound>
    static Functor callee(const FNCountedPtr<C>& object, M member, const Bound&... bound) {
        return Functor(new CalleePointer<FNCountedPtr<C>, M, Bound...>(object, member, bound...));
    }
    template <class F, class... Bound> static Functor function(F function, const Bound&... bound) {
        return Functor(new Fnct<F, Bound...>(std::move(function), bound...));
    }

    R operator()(const A&... args) const { return (*body_.get())(args...); }

private:
    FNCountedPtr<Body> body_;
};

using Functor0 = Functor<void>;
template <class R> using Functor0Ret = Functor<R>;
template <class A> using Functor1 = Functor<void, A>;
template <class A, class R> using Functor1Ret = Functor<R, A>;
template <class A, class B> using Functor2 = Functor<void, A, B>;
template <class A, class B, class C> using Functor3 = Functor<void, A, B, C>;

} // namespace Fn
