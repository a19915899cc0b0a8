// SPDX-License-Identifier: Apache-2.0
// The access pattern that all singleton classes share.
#include <type_traits>

#include "support/PlatformTest.h"
#include "support/Together.h"

using namespace fake;
using testing::Each;
using testing::Field;

namespace {

template <class Singleton>
const SourceFile& sourceOf()
{
    if constexpr (std::is_same_v<Singleton, CoreSystem>)
        return CORE_SYSTEM;
    else if constexpr (std::is_same_v<Singleton, SimManager>)
        return SIM_MANAGER;
    else if constexpr (std::is_same_v<Singleton, ConnectionManager>)
        return CONNECTION_MANAGER;
    else
        return D_BUS_MANAGER;
}

typedef testing::Types<CoreSystem, SimManager, ConnectionManager, DBusManager> Singletons;

template <class... Classes>
void destroyInstances(testing::Types<Classes...>)
{
    (CoreSystemInternals::destroyInstance<Classes>(), ...);
}

// The classes that have an instance now.
template <class... Classes>
Texts instances(testing::Types<Classes...>)
{
    Texts names;
    const auto add = [&names](const void* instance, const std::string& name) {
        if (instance != nullptr)
            names.push_back(name);
    };
    (add(CoreSystemInternals::instance<Classes>(), sourceOf<Classes>().className), ...);
    return names;
}

// Looks before the first test does anything.
class LoadTime : public testing::Environment {
public:
    static bool nothingHappened;

    void SetUp() override
    {
        nothingHappened = platform().events().empty() && instances(Singletons()).empty();
    }
};
bool LoadTime::nothingHappened = false;

testing::Environment* const loadTime = testing::AddGlobalTestEnvironment(new LoadTime);

// As after loading: there is no instance, and nothing is recorded.
template <class Singleton>
class SingletonTest : public testing::Test {
protected:
    SingletonTest()
    {
        CoreSystemInternals::destroyInstance<Singleton>();
        platform().reset();
        platform().debugMode = 1;
    }
    ~SingletonTest() override
    {
        CoreSystemInternals::destroyInstance<Singleton>();
        platform().reset();
    }

    const SourceFile& source = sourceOf<Singleton>();

    std::string constructorLine() const
    {
        return source.debug(source.className, source.className + "()");
    }
    // A GetInstance() with something inside its lock.
    Texts accessAround(const std::string& line) const
    {
        Texts trace = source.access();
        trace.insert(trace.end() - 1, line);
        return trace;
    }
};

class SingletonName {
public:
    template <class Singleton>
    static std::string GetName(int)
    {
        return sourceOf<Singleton>().className;
    }
};
TYPED_TEST_SUITE(SingletonTest, Singletons, SingletonName);

TYPED_TEST(SingletonTest, LoadingDoesNothing)
{
    EXPECT_TRUE(LoadTime::nothingHappened);
    EXPECT_NE(loadTime, nullptr);
}

TYPED_TEST(SingletonTest, HasVirtualDestructorAndNoData)
{
    EXPECT_TRUE(std::has_virtual_destructor<TypeParam>::value);
    EXPECT_EQ(sizeof(TypeParam), sizeof(void*));
    EXPECT_FALSE(std::is_default_constructible<TypeParam>::value);
    EXPECT_FALSE(std::is_destructible<TypeParam>::value);
    EXPECT_FALSE(std::is_copy_constructible<TypeParam>::value);
    EXPECT_FALSE(std::is_copy_assignable<TypeParam>::value);
}

TYPED_TEST(SingletonTest, FirstCallConstructsUnderItsLockAndLaterOnesFindTheInstance)
{
    destroyInstances(Singletons());
    TypeParam* const instance = TypeParam::GetInstance();
    ASSERT_NE(instance, nullptr);
    EXPECT_EQ(instance, CoreSystemInternals::instance<TypeParam>());
    EXPECT_EQ(instances(Singletons()), Texts{this->source.className}); // and no other
    EXPECT_EQ(platform().trace(), this->accessAround(this->constructorLine()));
    EXPECT_EQ(platform().lines().size(), 2u);
    for (int i = 0; i < 3; ++i) {
        EXPECT_THAT(platform().lines(), Each(Field(&LogLine::tag, this->source.defaultTag)));
        platform().forgetEvents();
        EXPECT_EQ(TypeParam::GetInstance(), instance);
        EXPECT_EQ(platform().trace(), this->source.access());
    }
    platform().forgetEvents();
    CoreSystemInternals::destroyInstance<TypeParam>();
    EXPECT_TRUE(platform().events().empty());
}

TYPED_TEST(SingletonTest, FailedAllocationGivesNullAndIsTriedAgain)
{
    const std::string failed = this->source.className + "() failed.";
    for (int i = 0; i < 2; ++i) {
        platform().forgetEvents();
        const FailingAllocation failure(Allocation::NOTHROW);
        EXPECT_EQ(TypeParam::GetInstance(), nullptr);
        EXPECT_TRUE(failure.happened());
        EXPECT_EQ(platform().trace(),
                  this->accessAround(this->source.error("GetInstance", failed)));
        EXPECT_EQ(platform().lines().back().tag, this->source.defaultTag);
    }
    platform().forgetEvents();
    EXPECT_NE(TypeParam::GetInstance(), nullptr);
    EXPECT_EQ(platform().trace(), this->accessAround(this->constructorLine()));
}

TYPED_TEST(SingletonTest, ManyThreadsGetOneInstanceConstructedOnce)
{
    const int THREADS = 8;
    TypeParam* instances[THREADS] = {};
    together(THREADS, [&instances](int number) { instances[number] = TypeParam::GetInstance(); });
    ASSERT_NE(instances[0], nullptr);
    EXPECT_THAT(instances, Each(instances[0]));

    const Texts trace = platform().trace();
    const auto times = [&trace](const std::string& text) {
        return std::count(trace.begin(), trace.end(), text);
    };
    EXPECT_EQ(times(this->constructorLine()), 1);
    EXPECT_EQ(times(this->source.lock()), THREADS);
    EXPECT_EQ(times("un" + this->source.lock()), THREADS);
}

} // namespace
