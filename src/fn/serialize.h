#pragma once

#include "fn/optional.h"
#include "fn/package.h"

#include <functional>
#include <list>
#include <map>
#include <set>
#include <string>
#include <vector>

/// Packing of values: `Fn::serialize<T>(value)` gives a package, `Fn::deSerialize<T>(package)` the value
/// back.
///
/// A class takes part through a conversion to Package and a constructor from `const Package&`, any other type
/// through a specialisation of Fn::Serializer.

namespace Fn {

/// How values of one type are packed; the general form is for classes that do it themselves.
template <class T> struct Serializer {
    static Package pack(const T& value) { return static_cast<Package>(value); }
    static T unpack(const Package& package) { return T(package); }
};

template <class T> Package serialize(const T& value) {
    return Serializer<T>::pack(value);
}

/// @throws FNEBadArg if the package does not hold a `T`.
template <class T> T deSerialize(const Package& package) {
    return Serializer<T>::unpack(package);
}

/// Scalars: `toValue` is the member of Package that reads one.
template <class T, T (Package::*toValue)() const> struct ScalarSerializer {
    static Package pack(T value) { return Package(value); }
    static T unpack(const Package& package) { return (package.*toValue)(); }
};
template <> struct Serializer<int> : ScalarSerializer<int, &Package::toInt32> {};
template <> struct Serializer<unsigned int> : ScalarSerializer<unsigned int, &Package::toUInt32> {};
template <> struct Serializer<long> : ScalarSerializer<long, &Package::toInt64> {};
template <> struct Serializer<unsigned long> : ScalarSerializer<unsigned long, &Package::toUInt64> {};
template <> struct Serializer<float> : ScalarSerializer<float, &Package::toFloat> {};
template <> struct Serializer<double> : ScalarSerializer<double, &Package::toDouble> {};
template <> struct Serializer<bool> : ScalarSerializer<bool, &Package::toBool> {};

/// One core: the text with its terminating NUL. Reading stops at the first NUL.
template <> struct Serializer<std::string> {
    static Package pack(const std::string& text);
    static std::string unpack(const Package& package);
};

template <> struct Serializer<Package> {
    static Package pack(const Package& package) { return package; }
    static Package unpack(const Package& package) { return package; }
};

/// A list with no element if the value is not set, with one otherwise.
template <class T> struct Serializer<Optional<T>> {
    static Package pack(const Optional<T>& value) {
        std::list<Package> elements;
        if (value.isSet()) elements.push_back(serialize<T>(*value));
        return Package(elements);
    }
    static Optional<T> unpack(const Package& package);
};

/// The elements of a list of packages, one after another.
class PackageReader {
public:
    /// @throws FNEBadArg if the package is not a list.
    explicit PackageReader(const Package& package) : elements_(package) {}

    bool atEnd() const noexcept { return elements_.empty(); }
    std::size_t remaining() const noexcept { return elements_.size(); }

    /// The next element. @throws FNEBadArg if there is none or it is not a `T`.
    template <class T> T next() {
        const Package element = take();
        return deSerialize<T>(element);
    }

    /// @throws FNEBadArg if there are elements left.
    void expectEnd() const;

private:
    Package take();

    std::list<Package> elements_;
};

template <class T> Optional<T> Serializer<Optional<T>>::unpack(const Package& package) {
    PackageReader reader(package);
    if (reader.atEnd()) return {};
    const T value = reader.next<T>();
    reader.expectEnd();
    return value;
}

/// A standard sequence or set that packs as the list of its elements in iteration order.
template <class Container> class SerializableSequence : public Container {
public:
    using Container::Container;
    SerializableSequence() = default;
    SerializableSequence(const Container& elements) : Container(elements) {}
    explicit SerializableSequence(const Package& package) {
        for (PackageReader reader(package); !reader.atEnd();)
            this->insert(this->end(), reader.next<typename Container::value_type>());
    }
    explicit operator Package() const {
        std::list<Package> elements;
        for (const auto& element : *this)
            elements.push_back(serialize<typename Container::value_type>(element));
        return Package(elements);
    }
};
template <class T> using SerializableList = SerializableSequence<std::list<T>>;
template <class T> using SerializableVector = SerializableSequence<std::vector<T>>;
template <class T, class Less = std::less<T>>
using SerializableMultiset = SerializableSequence<std::multiset<T, Less>>;

/// A standard map that packs as a list with one element for each entry in key order, itself a list of key and
/// value.
template <class Map> class SerializableAssociation : public Map {
public:
    using Map::Map;
    SerializableAssociation() = default;
    SerializableAssociation(const Map& entries) : Map(entries) {}
    explicit SerializableAssociation(const Package& package) {
        for (PackageReader reader(package); !reader.atEnd();) {
            PackageReader entry(reader.next<Package>());
            auto key = entry.next<typename Map::key_type>();
            this->emplace(std::move(key), entry.next<typename Map::mapped_type>());
            entry.expectEnd();
        }
    }
    explicit operator Package() const {
        std::list<Package> elements;
        for (const auto& [key, value] : *this)
            elements.emplace_back(std::list<Package>{serialize<typename Map::key_type>(key),
                                                     serialize<typename Map::mapped_type>(value)});
        return Package(elements);
    }
};
template <class K, class V> using SerializableMap = SerializableAssociation<std::map<K, V>>;
template <class K, class V> using SerializableMultiMap = SerializableAssociation<std::multimap<K, V>>;

} // namespace Fn

/// Two values; packs as the list of both.
template <class A, class B> struct FNPair {
    A first{};
    B second{};

    FNPair() = default;
    FNPair(const A& a, const B& b) : first(a), second(b) {}
    explicit FNPair(const Fn::Package& package) : FNPair(Fn::PackageReader(package)) {}
    explicit operator Fn::Package() const {
        return Fn::Package(std::list<Fn::Package>{Fn::serialize<A>(first), Fn::serialize<B>(second)});
    }
    bool operator==(const FNPair&) const = default;

private:
    explicit FNPair(Fn::PackageReader reader) : first(reader.next<A>()), second(reader.next<B>()) {
        reader.expectEnd();
    }
};

/// Three values; packs as the list of them.
template <class A, class B, class C> struct FNTriple {
    A first{};
    B second{};
    C third{};

    FNTriple() = default;
    FNTriple(const A& a, const B& b, const C& c) : first(a), second(b), third(c) {}
    explicit FNTriple(const Fn::Package& package) : FNTriple(Fn::PackageReader(package)) {}
    explicit operator Fn::Package() const {
        return Fn::Package(std::list<Fn::Package>{Fn::serialize<A>(first), Fn::serialize<B>(second),
                                                  Fn::serialize<C>(third)});
    }
    bool operator==(const FNTriple&) const = default;

private:
    explicit FNTriple(Fn::PackageReader reader)
        : first(reader.next<A>()), second(reader.next<B>()), third(reader.next<C>()) {
        reader.expectEnd();
    }
};
