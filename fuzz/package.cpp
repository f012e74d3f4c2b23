// Packages from memory and from a stream: both readers accept the same bytes and give the same cores, and so
// does the view of the bytes, which takes the same ones for a list, too.

#include "fn/package_view.h"
#include "fn/serialize.h"

#include <algorithm>
#include <cstdlib>
#include <sstream>

namespace {

template <class Read> bool accepts(Read read) {
    try {
        read();
        return true;
    } catch (const FNException&) {
        return false;
    }
}

/// Compares a package with the view of the same one, and lists with what is in them.
void compare(const Fn::Package& package, Fn::PackageView view, int depth) {
    if (view.count() != package.cores().size()) std::abort();
    std::list<Fn::Package> elements;
    const bool isList = accepts([&] { elements = package; });
    if (accepts([&] { Fn::PackageListView{view}; }) != isList) std::abort();
    if (isList && depth < 8) {
        Fn::PackageListView list(view);
        if (list.remaining() != elements.size()) std::abort();
        for (const Fn::Package& element : elements) compare(element, list.next(), depth + 1);
        if (accepts([&] { list.next(); })) std::abort();
    }
    unsigned int value = 0, viewed = 0;
    if (accepts([&] { value = package.toUInt32(); }) != accepts([&] { viewed = view.toUInt32(); }))
        std::abort();
    if (value != viewed) std::abort();
    for (const Fn::Package::Core& core : package.cores())
        if (!std::ranges::equal(view.take(), std::span(core.data(), core.size()))) std::abort();
}

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    Fn::Package fromMemory, fromStream;
    const bool memory = accepts([&] { fromMemory = Fn::Package(data, size); });
    const bool stream = accepts([&] {
        std::istringstream bytes(std::string(reinterpret_cast<const char*>(data), size));
        fromStream = Fn::Package(bytes);
    });
    if (memory != stream || fromMemory.size() != fromStream.size()) std::abort();
    const Fn::PackageView::Bytes bytes(data, size);
    if (accepts([&] { Fn::PackageView{bytes}; }) != memory) std::abort();
    if (!memory) return 0;
    compare(fromMemory, Fn::PackageView(bytes), 0);

    std::string written(fromMemory.size(), '\0');
    fromMemory.write(reinterpret_cast<unsigned char*>(written.data()));
    if (written.compare(0, written.size(), reinterpret_cast<const char*>(data), written.size()) != 0)
        std::abort();

    accepts([&] { Fn::deSerialize<Fn::SerializableMap<std::string, std::string>>(fromMemory); });
    accepts([&] { Fn::deSerialize<Fn::SerializableList<Fn::SerializableList<int>>>(fromMemory); });
    accepts([&] { Fn::deSerialize<Fn::Optional<bool>>(fromMemory); });
    accepts([&] { Fn::deSerialize<FNTriple<float, double, unsigned long>>(fromMemory); });
    return 0;
}
