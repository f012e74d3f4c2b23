#pragma once

#include "fn/image_reference.h"

/// A counted handle of images that stand in an order and are made when they are asked for.
class FNImageSet {
public:
    class Body {
    public:
        virtual ~Body() = default;
        /// Below 1 there is none.
        virtual int count() const = 0;
        /// @param index from 0 to count() - 1
        virtual FNImageReference get(int index) const = 0;
    };

    explicit FNImageSet(const FNCountedPtr<Body>& body) : body_(body) {}

    int count() const { return body_->count(); }
    FNImageReference operator[](int index) const { return body_->get(index); }

private:
    FNCountedPtr<Body> body_;
};
