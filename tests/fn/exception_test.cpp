#include "fn/exception_factory.h"
#include "fn/serialize.h"

#include <gtest/gtest.h>

#include <sstream>

namespace {

std::string printed(const FNException& exception) {
    std::ostringstream stream;
    stream << exception;
    return stream.str();
}

TEST(Exception, PrintsClassTextAndPlace) {
    EXPECT_EQ(printed(FNEBadArg("x", "a", 7)), "Exception[FNEBadArg]: x in a line 7");
    EXPECT_EQ(printed(FNEBadArg("x", nullptr, 7)), "Exception[FNEBadArg]: x in nofile line 7");
    EXPECT_EQ(printed(FNEBadArg("x", "a", 7, nullptr)), "Exception[") << "a null type id fails the stream";

    std::ostringstream throwing;
    throwing.exceptions(std::ios::badbit);
    EXPECT_NO_THROW(FNEBadArg("x", "a", 7, nullptr).print(throwing));
    EXPECT_TRUE(throwing.bad());
}

TEST(Exception, DescribesItselfWithoutAText) {
    const FNEBadArg none(nullptr, "a", 1), empty("", "a", 1);
    EXPECT_STREQ(none.what(), "[FNEBadArg]: No description.");
    EXPECT_STREQ(none.what(), "[FNEBadArg]: No description.");
    EXPECT_STREQ(empty.what(), "[FNEBadArg]: No description.");
}

TEST(Exception, CutsLongTextsAndCopiesThem) {
    const std::string text(3000, 't');
    const FNEIOError original(text.c_str(), "a", 1);
    const FNEIOError copy = original;
    EXPECT_EQ(copy.what(), text.substr(0, 2047));
    EXPECT_NE(copy.what(), original.what());
}

TEST(Exception, ThrowingSiteIsNamedWithoutItsFolder) {
    try {
        FN_THROW(FNETimeOut, "late");
    } catch (const FNERuntime& e) {
        EXPECT_STREQ(e.file(), "exception_test.cpp");
        EXPECT_STREQ(e.typeId(), "FNETimeOut");
        EXPECT_GT(e.line(), 0);
    }
}

template <class E> void expectCrossing(const Fn::ExceptionFactory& factory) {
    try {
        factory.throwException(factory.serialize(E("text", "file.cpp", 12)));
    } catch (const E& e) {
        EXPECT_EQ(printed(e), std::string("Exception[") + E::thisTypeId + "]: text in file.cpp line 12");
        return;
    }
    ADD_FAILURE() << E::thisTypeId << " came back as something else";
}

TEST(ExceptionFactory, EveryClassCrossesTheBoundary) {
    const Fn::ExceptionFactory factory;
    expectCrossing<FNEIOError>(factory);
    expectCrossing<FNEBadFormat>(factory);
    expectCrossing<FNESysError>(factory);
    expectCrossing<FNETimeOut>(factory);
    expectCrossing<FNEGeneric>(factory);
    expectCrossing<FNEOutOfRange>(factory);
    expectCrossing<FNEBadArg>(factory);
    expectCrossing<FNEBadFunCall>(factory);
}

TEST(ExceptionFactory, PacksOneTwoOrFourElements) {
    const Fn::ExceptionFactory factory;
    const auto length = [](const Fn::Package& p) { return std::list<Fn::Package>(p).size(); };
    EXPECT_EQ(length(factory.serialize("m", "", "f", 1)), 1u);
    EXPECT_EQ(length(factory.serialize("m", "t", "", 1)), 2u);
    EXPECT_EQ(length(factory.serialize("m", "t", "f", 1)), 4u);
    EXPECT_EQ(length(factory.serialize(std::runtime_error("m"))), 1u);
}

TEST(ExceptionFactory, UnknownTypesBecomeGeneric) {
    const Fn::ExceptionFactory factory;
    try {
        factory.throwException("text", "SomeType", "f", 3);
    } catch (const FNEGeneric& e) {
        EXPECT_EQ(printed(e), "Exception[FNEGeneric]: [SomeType] text in f line 3");
    }
    try {
        factory.throwException(factory.serialize("text", "", "", 0));
    } catch (const std::exception& e) {
        EXPECT_STREQ(e.what(), "text");
        EXPECT_EQ(dynamic_cast<const FNException*>(&e), nullptr);
    }
    EXPECT_THROW(factory.throwException(Fn::Package(7)), FNEBadArg);
}

TEST(ExceptionFactory, TheFileNameOutlivesItsPackage) {
    const Fn::ExceptionFactory factory;
    const FNException* kept = nullptr;
    std::exception_ptr held;
    try {
        const Fn::Package package = factory.serialize("m", "FNEBadArg", std::string("gone.cpp"), 1);
        factory.throwException(package);
    } catch (const FNEBadArg& e) {
        held = std::current_exception();
        kept = &e;
    }
    ASSERT_TRUE(kept);
    EXPECT_STREQ(FNEBadArg(static_cast<const FNEBadArg&>(*kept)).file(), "gone.cpp");
}

} // namespace
