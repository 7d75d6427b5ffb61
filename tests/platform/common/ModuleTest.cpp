#include "Module.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

using pelliko::platform::moduleFunction;
using testing::HasSubstr;
using testing::ThrowsMessage;

TEST(Module, AFunctionOfAModuleIsFoundOnceAndAgain)
{
    const void *door = moduleFunction("pelliko-vcards.so", "pelliko_vcard_functions");
    ASSERT_NE(door, nullptr);
    EXPECT_EQ(moduleFunction("pelliko-vcards.so", "pelliko_vcard_functions"), door);
}

TEST(Module, AModuleThatIsNotInstalledIsNamed)
{
    EXPECT_THAT([] { moduleFunction("pelliko-nowhere.so", "door"); },
                ThrowsMessage<std::runtime_error>(HasSubstr("pelliko-nowhere.so")));
}

TEST(Module, AModuleWithoutTheFunctionIsNamedWithIt)
{
    EXPECT_THAT([] { moduleFunction("pelliko-vcards.so", "no_such_door"); },
                ThrowsMessage<std::runtime_error>(HasSubstr("no_such_door")));
}
