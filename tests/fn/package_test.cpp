#include "fn/byte_order.h"
#include "fn/package_view.h"
#include "fn/serialize.h"
#include "support/each_target.h"
#include "support/thrown.h"

#include <gtest/gtest.h>

#include <bit>
#include <functional>
#include <limits>
#include <numeric>
#include <sstream>

namespace {

using Fn::Package;
using Bytes = std::vector<unsigned char>;

Bytes bytesOf(const Package& package) {
    Bytes bytes(package.size());
    package.write(bytes.data());
    return bytes;
}

Package parsed(const Bytes& bytes) {
    return Package(bytes.data(), bytes.size());
}

template <class T> void expectRoundTrip(const T& value) {
    EXPECT_EQ(Fn::deSerialize<T>(parsed(bytesOf(Fn::serialize<T>(value)))), value);
}

TEST(Package, ScalarsHaveTheirStoredForm) {
    EXPECT_EQ(bytesOf(Package(5)), (Bytes{0, 0, 0, 1, 0, 0, 0, 4, 0, 0, 0, 5}));
    EXPECT_EQ(bytesOf(Package(0x0102030405060708L)), (Bytes{0, 0, 0, 1, 0, 0, 0, 8, 5, 6, 7, 8, 1, 2, 3, 4}));
    EXPECT_EQ(bytesOf(Package(1.0)), (Bytes{0, 0, 0, 1, 0, 0, 0, 8, 0, 0, 0, 0, 0x3F, 0xF0, 0, 0}));
    EXPECT_EQ(bytesOf(Package(1.0f)), (Bytes{0, 0, 0, 1, 0, 0, 0, 4, 0x3F, 0x80, 0, 0}));
    EXPECT_EQ(bytesOf(Package(true)), (Bytes{0, 0, 0, 1, 0, 0, 0, 5, 't', 'r', 'u', 'e', 0}));
    EXPECT_EQ(bytesOf(Fn::serialize<std::string>("")), (Bytes{0, 0, 0, 1, 0, 0, 0, 1, 0}));
    EXPECT_EQ(bytesOf(Package()), (Bytes{0, 0, 0, 0}));
}

TEST(Package, ScalarsReadBack) {
    expectRoundTrip(std::numeric_limits<int>::min());
    expectRoundTrip(std::numeric_limits<unsigned int>::max());
    expectRoundTrip(std::numeric_limits<long>::min());
    expectRoundTrip(std::numeric_limits<unsigned long>::max());
    expectRoundTrip(-1.5e-42f);
    expectRoundTrip(std::numeric_limits<double>::denorm_min());
    expectRoundTrip(false);
    expectRoundTrip(std::string("täxt"));
    EXPECT_EQ(Fn::deSerialize<std::string>(Fn::serialize<std::string>(std::string("a\0b", 3))), "a");
}

TEST(Package, RealArraysHaveTheStoredForm) {
    const float floats[] = {1.0f, -2.5f};
    const double doubles[] = {1.0, 0x1.015bf9217271ap-5};
    unsigned char stored[16];
    htonf(floats, stored, 2);
    EXPECT_EQ(Bytes(stored, stored + 8), (Bytes{0x3F, 0x80, 0, 0, 0xC0, 0x20, 0, 0}));
    htond(doubles, stored, 2);
    EXPECT_EQ(Bytes(stored + 8, stored + 16), (Bytes{0x92, 0x17, 0x27, 0x1A, 0x3F, 0xA0, 0x15, 0xBF}));
    double back[2];
    ntohd(stored, back, 2);
    EXPECT_EQ(back[1], doubles[1]);

    forEachTarget([] {
        for (std::size_t n = 0; n < 70; ++n) {
            Bytes bytes(4 * n + 1); // not aligned
            std::iota(bytes.begin(), bytes.end(), static_cast<unsigned char>(n));
            std::vector<float> values(n);
            ntohf(bytes.data() + 1, values.data(), n);
            for (std::size_t i = 0; i < n; ++i)
                ASSERT_EQ(std::bit_cast<std::uint32_t>(values[i]), Fn::loadUInt32(&bytes[4 * i + 1]));
            Bytes again(4 * n + 1, bytes[0]);
            htonf(values.data(), again.data() + 1, n);
            ASSERT_EQ(again, bytes);
        }
    });
}

TEST(Package, ListsFlattenAndUnfold) {
    const std::list<Package> none, oneEmpty{Package()};
    EXPECT_EQ(bytesOf(Package(none)), (Bytes{0, 0, 0, 1, 0, 0, 0, 4, 0, 0, 0, 0}));
    EXPECT_TRUE(Package(none).valid());
    EXPECT_TRUE(std::list<Package>(Package(none)).empty());
    EXPECT_EQ(Package(oneEmpty).cores().size(), 2u);
    EXPECT_EQ(std::list<Package>(Package(oneEmpty)), oneEmpty);
    const std::list<Package> nested{Package(1), Package(std::list<Package>{Package(2.0), Package(oneEmpty)})};
    EXPECT_EQ(std::list<Package>(Package(nested)), nested);
}

TEST(Package, ContainersReadBack) {
    expectRoundTrip(FNPair<int, std::string>(3, "three"));
    expectRoundTrip(FNTriple<bool, float, FNPair<int, int>>(true, 0.5f, {1, 2}));
    expectRoundTrip(Fn::SerializableList<std::string>{"b", "a"});
    expectRoundTrip(Fn::SerializableVector<double>{});
    expectRoundTrip(Fn::SerializableMultiset<int>{3, 1, 3});
    expectRoundTrip(Fn::SerializableMap<std::string, Fn::SerializableList<int>>{{"x", {1, 2}}, {"y", {}}});
    expectRoundTrip(Fn::SerializableMultiMap<int, int>{{1, 2}, {1, 3}});
    EXPECT_EQ(*Fn::deSerialize<Fn::Optional<int>>(Fn::serialize(Fn::Optional<int>(4))), 4);
    EXPECT_EQ(bytesOf(Fn::serialize(Fn::Optional<int>())), bytesOf(Package(0)));
    EXPECT_FALSE(Fn::deSerialize<Fn::Optional<int>>(Package(0)).isSet());
}

TEST(Package, StreamsAndFilesCarryCoresOfEverySize) {
    const std::vector<std::vector<std::uint64_t>> shapes = {{},
                                                            {1},
                                                            std::vector<std::uint64_t>(1000, 12),
                                                            {1 << 20},
                                                            {4096, 4097, 8192, 3, 8190, 8193},
                                                            {(5 << 20) + 3, 1, 7}};
    for (const auto& shape : shapes) {
        std::list<Package::Core> cores;
        for (const std::uint64_t size : shape) {
            Package::Core core(size);
            for (std::uint64_t i = 0; i < size; ++i)
                core.getExclusive()[i] = static_cast<unsigned char>(i * 7 + size);
            cores.push_back(core);
        }
        const Package package(cores);
        std::stringstream stream;
        package.write(stream);
        stream << "tail";
        const Bytes bytes = bytesOf(package);
        EXPECT_EQ(stream.str(), std::string(bytes.begin(), bytes.end()) + "tail");
        EXPECT_EQ(Package(stream), package);
        EXPECT_EQ(stream.get(), 't') << "reading stops behind the last core";

        std::FILE* const file = std::tmpfile();
        package.write(file);
        std::rewind(file);
        EXPECT_EQ(Package(file), package);
        std::fclose(file);
    }
}

TEST(Package, DifferentEmptyCoresAreNotEqual) {
    const Package empty(std::list<Package::Core>{Package::Core()});
    EXPECT_EQ(empty, Package(empty));
    EXPECT_NE(empty, parsed(bytesOf(empty)));
}

TEST(Package, TruncatedMemoryIsRefused) {
    const Bytes whole = bytesOf(Package(std::list<Package>{Package(1), Package(true)}));
    for (std::size_t size = 0; size < whole.size(); ++size) {
        const char* const step = size < 4 ? "number of cores" : size < 4 + 4 * 5 ? "sizes of cores" : "core";
        EXPECT_EQ(thrownBy([&] { Package(whole.data(), size); }),
                  std::string("FNEBadArg: creating Package from memory: reading ") + step);
        EXPECT_EQ(thrownBy([&] {
                      Fn::PackageView({whole.data(), size});
                  }),
                  std::string("FNEBadArg: creating Package from memory: reading ") + step);
        std::istringstream stream(std::string(whole.begin(), whole.begin() + size));
        EXPECT_THROW(Package{stream}, FNEIOError);
    }
}

/// A stream without end or length, so that only the reader's own care bounds the memory.
class Endless : public std::streambuf {
public:
    explicit Endless(const Bytes& head) { setg(text(head), text(head), text(head) + head.size()); }
    std::size_t served = 0;

protected:
    int_type underflow() override {
        if (served > (64u << 20)) return traits_type::eof();
        served += sizeof block_;
        setg(block_, block_, block_ + sizeof block_);
        return traits_type::to_int_type(block_[0]);
    }

private:
    static char* text(const Bytes& bytes) {
        return const_cast<char*>(reinterpret_cast<const char*>(bytes.data()));
    }
    char block_[4096] = {};
};

TEST(Package, HugeAnnouncementsCostOnlyWhatArrives) {
    const struct {
        Bytes head;
        const char* memoryText;
        const char* streamText;
    } cases[] = {{{0xFF, 0xFF, 0xFF, 0xFF, 0, 0, 0, 0},
                  "creating Package from memory: reading sizes of cores",
                  "Package: error reading sizes of cores from istream"},
                 {{0, 0, 0, 1, 0xFF, 0xFF, 0xFF, 0xFF, 1, 2, 3},
                  "creating Package from memory: reading core",
                  "Package: error reading core from istream: got error reading 4294967295 bytes"}};
    for (const auto& c : cases) {
        EXPECT_EQ(thrownBy([&] { parsed(c.head); }), std::string("FNEBadArg: ") + c.memoryText);
        std::istringstream stream(std::string(c.head.begin(), c.head.end()));
        EXPECT_EQ(thrownBy([&] { Package{stream}; }), std::string("FNEIOError: ") + c.streamText);
    }
    Endless zeros(cases[1].head);
    std::istream stream(&zeros);
    EXPECT_THROW(Package{stream}, FNEIOError) << "ends after 64 MB of 4 GB";
}

TEST(Package, WrongShapesAreNamed) {
    const Package two(std::list<Package::Core>{Package(1).cores().front(), Package(2).cores().front()});
    const struct {
        std::function<void()> call;
        const char* text;
    } cases[] = {
        {[&] { two.toInt32(); }, "converting to FNInt32 from an invalid package"},
        {[&] { Package(1L).toUInt32(); }, "converting to FNUInt32 from an invalid package"},
        {[&] { Package(1).toInt64(); }, "converting to FNInt64 from an invalid package"},
        {[&] { Package().toUInt64(); }, "converting to FNUInt64 from an invalid package"},
        {[&] { Package(1.0).toFloat(); }, "converting to float from an invalid package"},
        {[&] { Package(1.0f).toDouble(); }, "converting to double from an invalid package"},
        {[&] { Fn::serialize<std::string>("yes").toBool(); }, "converting to bool from an invalid package"},
        {[&] { two.toBool(); }, "converting to bool from an invalid package"},
        {[&] { Fn::deSerialize<std::string>(Package(0x41424344)); },
         "converting to std::string from invalid package"},
        {[&] { (void)std::list<Package>(Package()); }, "converting to list<Package> from an invalid package"},
        {[&] { (void)std::list<Package>(two); },
         "converting to list<Package> from an invalid package(mismatch of number of cores)"},
        {[&] { (void)std::list<Package>(Package(1)); },
         "converting to list<Package> from an invalid package (mismatch of number of packages)"},
        {[&] {
             std::list<Package::Core> cores = Package(std::list<Package>{Package(), Package()}).cores();
             cores.front() = Package(1).cores().front();
             (void)std::list<Package>(Package(cores));
         },
         "inconsistency detected converting to list<Package> from an invalid package"},
    };
    for (const auto& c : cases) EXPECT_EQ(thrownBy(c.call), std::string("FNEBadArg: ") + c.text);
}

TEST(PackageView, ReadsListsWhereTheyLie) {
    const Bytes bytes = bytesOf(Package(std::list<Package>{
        Package(7), Fn::serialize<std::string>("bob"), Package(std::list<Package>{Package(8), Package()})}));
    Fn::PackageListView list{Fn::PackageView(bytes)};
    ASSERT_EQ(list.remaining(), 3u);
    EXPECT_EQ(list.next().toUInt32(), 7u);
    Fn::PackageView text = list.next();
    EXPECT_EQ(text.count(), 1u);
    const auto core = text.take();
    EXPECT_EQ(std::string(core.begin(), core.end()), std::string("bob", 4));
    Fn::PackageListView inner(list.next());
    EXPECT_EQ(inner.next().toUInt32(), 8u);
    const Fn::PackageView empty = inner.next();
    EXPECT_EQ(empty.count(), 0u);
    EXPECT_THROW(empty.toUInt32(), FNEBadArg);
    EXPECT_THROW(Fn::PackageListView{empty}, FNEBadArg);
    EXPECT_THROW(inner.next(), FNEBadArg);
}

TEST(Package, AFailedWriteIsReported) {
    std::ostringstream broken;
    broken.setstate(std::ios::badbit);
    EXPECT_EQ(thrownBy([&] { Package(1).write(broken); }), "FNEIOError: Package: error writing to ostream");
    std::FILE* const full = std::fopen("/dev/full", "w");
    std::setvbuf(full, nullptr, _IONBF, 0);
    EXPECT_EQ(thrownBy([&] { Package(1).write(full); }), "FNEIOError: Package: error writing to FILE");
    std::fclose(full);
}

} // namespace
