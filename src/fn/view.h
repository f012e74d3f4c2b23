#pragma once

#include "fn/cptr.h"

#include <list>

namespace Fn {

/// A sequence of values that somebody hands out one after another.
template <class T> class View {
public:
    /// Handle on a place in the sequence; copies share it.
    class Iterator {
    public:
        class Body {
        public:
            virtual ~Body() = default;
            virtual bool atEnd() const = 0;
            /// The present value; not at the end.
            virtual T get() const = 0;
            virtual void advance() = 0;
        };

        explicit Iterator(const FNCountedPtr<Body>& body) : body_(body) {}

        bool atEnd() const { return body_->atEnd(); }
        T operator*() const { return body_->get(); }
        Iterator& operator++() { return body_->advance(), *this; }

    private:
        FNCountedPtr<Body> body_;
    };

    explicit View(const std::list<T>& values) : values_(values) {}

    /// A walk of its own over the values.
    Iterator begin() const { return Iterator(FNCountedPtr<typename Iterator::Body>(new Walk(values_))); }

private:
    class Walk final : public Iterator::Body {
    public:
        explicit Walk(const std::list<T>& values) : values_(values) {}
        bool atEnd() const override { return values_.empty(); }
        T get() const override { return values_.front(); }
        void advance() override { values_.pop_front(); }

    private:
        std::list<T> values_; ///< those that are left
    };

    std::list<T> values_;
};

} // namespace Fn
