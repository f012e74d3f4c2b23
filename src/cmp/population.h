#pragma once

#include "cmp/fir.h"

#include <algorithm>
#include <functional>
#include <vector>

namespace Cmp {

/// Named records to search in. Copies share them. There is no lock: contents do not change while a comparison
/// reads them.
class Population {
public:
    using Visitor = std::function<void(const std::string& id, const FIR& fir)>;

    class Body {
    public:
        virtual ~Body() = default;
        /// Appends; an id may come more than once. @throws std::bad_cast for a record of another algorithm
        virtual void add(const FIR& fir, const std::string& id) = 0;
        /// Removes the first record of that id, if there is one.
        virtual void remove(const std::string& id) = 0;
        /// The first record of that id. @throws FNEBadArg if there is none
        virtual FIR get(const std::string& id) const = 0;
        virtual std::size_t size() const = 0;
        /// Calls visit(id, record) for all, in order of addition.
        virtual void visit(const Visitor& visit) const = 0;
    };

    explicit Population(const FNCountedPtr<Body>& body) : body_(body) {}

    void add(const FIR& fir, const std::string& id) { body_->add(fir, id); }
    void remove(const std::string& id) { body_->remove(id); }
    FIR get(const std::string& id) const { return body_->get(id); }
    std::size_t size() const { return body_->size(); }
    void visit(const Visitor& visit) const { body_->visit(visit); }

    const FNCountedPtr<Body>& body() const { return body_; }

private:
    FNCountedPtr<Body> body_;
};

/// The population of an algorithm whose records are of class `T`.
template <class T> class FeatureSets final : public Population::Body {
public:
    struct Item {
        std::string id;
        FIR fir;
        const T* record; ///< the body of `fir`
    };

    /// @param capacity number of records to make room for
    explicit FeatureSets(std::size_t capacity = 0) { items_.reserve(capacity); }

    void add(const FIR& fir, const std::string& id) override {
        items_.push_back({id, fir, &dynamic_cast<const T&>(*fir.body())});
    }
    void remove(const std::string& id) override {
        const auto item = find(id);
        if (item != items_.end()) items_.erase(item);
    }
    FIR get(const std::string& id) const override {
        const auto item = find(id);
        if (item == items_.end()) FN_THROW(FNEBadArg, "Attempting to retrieve nonexisting element");
        return item->fir;
    }
    std::size_t size() const override { return items_.size(); }
    void visit(const Population::Visitor& visit) const override {
        for (const Item& item : items_) visit(item.id, item.fir);
    }

    /// In order of addition.
    const std::vector<Item>& items() const { return items_; }

private:
    typename std::vector<Item>::const_iterator find(const std::string& id) const {
        return std::ranges::find(items_, id, &Item::id);
    }

    std::vector<Item> items_;
};

} // namespace Cmp
