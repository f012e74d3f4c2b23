// Packages from memory and from a stream: both readers accept the same bytes and give the same cores.

#include "fn/serialize.h"

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

} // namespace

extern "C" int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size) {
    Fn::Package fromMemory, fromStream;
    const bool memory = accepts([&] { fromMemory = Fn::Package(data, size); });
    const bool stream = accepts([&] {
        std::istringstream bytes(std::string(reinterpret_cast<const char*>(data), size));
        fromStream = Fn::Package(bytes);
    });
    if (memory != stream || fromMemory.size() != fromStream.size()) std::abort();
    if (!memory) return 0;

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
