#include "fn/optional.h"
#include "fn/rmem.h"

#include <gtest/gtest.h>

#include <numeric>

namespace {

struct Tracked {
    explicit Tracked(int& deaths) : deaths_(deaths) {}
    virtual ~Tracked() { ++deaths_; }
    int& deaths_;
};
struct Derived : Tracked {
    using Tracked::Tracked;
};

TEST(CountedHandle, DeletesThePointeeWithTheLastHandle) {
    int deaths = 0;
    {
        FNCountedPtr<Tracked> a(new Derived(deaths));
        FNCountedPtr<Tracked> b(a), null;
        EXPECT_EQ(a.count(), 2);
        b = null;
        EXPECT_EQ(a.count(), 1);
        EXPECT_EQ(deaths, 0);
        FNCountedPtr<Derived> derived = a.dynamicCast<Derived>();
        a = null;
        EXPECT_EQ(deaths, 0);
    }
    EXPECT_EQ(deaths, 1);
}

TEST(CountedHandle, OwnsACountAlsoWhenNull) {
    FNCountedPtr<int> null, other(nullptr);
    EXPECT_EQ(null, other);
    EXPECT_EQ(null.count(), 1);
    EXPECT_EQ(other.count(), 1);
    EXPECT_THROW(*null, FNEBadFunCall);
    EXPECT_FALSE(FNCountedPtr<Tracked>().dynamicCast<Derived>());
}

TEST(CountedHandle, AssignmentOfTheSamePointeeKeepsAllCounts) {
    FNCountedPtr<int> a(new int(1));
    FNCountedPtr<int> b(a);
    FNCountedPtr<int>& alias = a;
    a = alias;
    b = a;
    EXPECT_EQ(a.count(), 2);
    FNCountedPtr<int> null, other;
    null = other; // both null: each keeps its own record
    EXPECT_EQ(other.count(), 1);
}

struct Node {
    FNCountedPtr<Node> next;
};

TEST(CountedHandle, AssignmentFromInsideTheOldPointee) {
    FNCountedPtr<Node> list(new Node{FNCountedPtr<Node>(new Node)});
    Node* const second = list->next.get();
    list = list->next; // the right side dies with the old left side
    EXPECT_EQ(list.get(), second);
    EXPECT_EQ(list.count(), 1);
}

TEST(Optional, ThrowsWhenReadUnset) {
    const Fn::Optional<int> unset, set(3);
    EXPECT_EQ(*set, 3);
    try {
        unset.get();
        FAIL();
    } catch (const FNEBadFunCall& e) {
        EXPECT_STREQ(e.what(), "Optional data accessed but not set!");
    }
}

TEST(Memory, AViewIsCopiedOnceWhenWrittenWhileShared) {
    FNRMem<int> a(4);
    for (int i = 0; i < 4; ++i) a[i] = i;
    FNRMem<int> middle(a, 1, 2);
    EXPECT_EQ(middle.data(), a.data() + 1);
    middle[0] = 10;
    EXPECT_EQ(a.data()[1], 1);
    EXPECT_EQ(middle.offset(), 0u);
    EXPECT_EQ(middle.core().size(), 2 * sizeof(int)) << "the copy holds only the view";
    EXPECT_EQ(middle.data()[1], 2);
    const int* const place = middle.data();
    middle[1] = 20;
    EXPECT_EQ(middle.data(), place);
    EXPECT_EQ(middle, FNRMem<int>(middle));
}

TEST(Memory, ASmallViewLeavesALargeBlockThatNobodyElseNeeds) {
    const struct {
        std::uint64_t block, offset, view;
        bool moves;
    } cases[] = {{7000, 100, 2000, true}, {7000, 100, 3000, false},  {7000, 0, 2333, false},
                 {7000, 0, 2332, true},   {1000000, 5, 1024, false}, {1000000, 5, 1025, true}};
    for (const auto& c : cases) {
        FNRMem<unsigned char> block(c.block);
        std::iota(block.getExclusive(), block.getExclusive() + c.block, static_cast<unsigned char>(0));
        FNRMem<unsigned char> view(block, c.offset, c.view);
        block = FNRMem<unsigned char>();
        const unsigned char* const before = view.data();
        view.getExclusive();
        EXPECT_EQ(view.data()[c.view - 1], static_cast<unsigned char>(c.offset + c.view - 1));
        EXPECT_EQ(view.data() != before, c.moves) << c.block << " " << c.view;
        EXPECT_EQ(view.offset(), c.moves ? 0 : c.offset);
    }
}

TEST(Memory, AllocatesAsPromised) {
    EXPECT_EQ(FNRMemCore(0).data(), nullptr);
    EXPECT_EQ(FNRMemCore(0, 0).data(), nullptr);
    for (int i = 1; i < 40; ++i) {
        EXPECT_EQ(reinterpret_cast<std::uintptr_t>(FNRMem<float>(i).data()) % 32, 0u);
        EXPECT_EQ(reinterpret_cast<std::uintptr_t>(FNRMem<FNComplex<double>>(i).data()) % 32, 0u);
        EXPECT_EQ(reinterpret_cast<std::uintptr_t>(FNRMemCore(i, 64).data()) % 64, 0u);
    }
    // A copy from the start of an aligned block is aligned as well.
    FNRMem<double> a(100), b(a);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(b.getExclusive()) % 32, 0u);
    EXPECT_EQ(b.core().alignment(), 32u);
}

TEST(Memory, WrappedMemoryFollowsItsRights) {
    int numbers[3] = {1, 2, 3};
    FNRMem<int> writable(numbers, 3, FNRMemCoreBody::preserve());
    writable[1] = 20;
    EXPECT_EQ(numbers[1], 20);

    FNRMem<int> constant(static_cast<const int*>(numbers), 3, FNRMemCoreBody::preserve(), false);
    constant[1] = 30;
    EXPECT_EQ(numbers[1], 20);
    EXPECT_EQ(constant.data()[1], 30);

    FNRMem<int> fixed(static_cast<const int*>(numbers), 3, FNRMemCoreBody::preserve(), true);
    EXPECT_EQ(fixed.data()[1], 20);
    EXPECT_THROW(fixed[1] = 1, FNESysError);

    FNRMem<bool> owned(new bool[5], 5, FNRMem<bool>::dtor()); // the address sanitizer sees a leak
    EXPECT_EQ(owned.size(), 5u);
}

TEST(Memory, RefusesWhatCannotBe) {
    FNRMem<int> a(4), empty;
    EXPECT_THROW(FNRMem<int>(a, 2, 3), FNEBadArg);
    EXPECT_THROW(FNRMem<int>(a, ~0ull, 2), FNEBadArg) << "offset + size wraps around";
    EXPECT_THROW(a[4], FNEOutOfRange);
    EXPECT_THROW(empty[0], FNEOutOfRange);
    EXPECT_NO_THROW(empty.getExclusive());
    EXPECT_THROW(FNRMemCore(8, 0), FNEBadArg);
    EXPECT_THROW(FNRMemCore(static_cast<void*>(nullptr), 8, FNRMemCoreBody::preserve()), FNEBadArg);
    EXPECT_THROW(FNRMemCore(0).demandExclusiveUse(0, 1), FNEBadArg);
    EXPECT_THROW(FNRMem<int>(~0ull / 2), std::bad_alloc) << "the size in bytes wraps around";
    EXPECT_THROW(FNRMem<unsigned char>{~0ull}, std::bad_alloc);
    EXPECT_THROW(FNRMem<float>(1ull << 61), FNESysError);
}

TEST(Memory, CoresCompareByBodyOrBytes) {
    FNRMemCore a(3), b(3), empty(0), otherEmpty(0);
    std::memcpy(a.writable(), "abc", 3);
    std::memcpy(b.writable(), "abc", 3);
    EXPECT_EQ(a, b);
    b.writable()[2] = 'd';
    EXPECT_NE(a, b);
    EXPECT_EQ(empty, FNRMemCore(empty));
    EXPECT_NE(empty, otherEmpty);
}

} // namespace
