// Gives the tests of this program a store of their own, empty before every case.
#pragma once

#include <app_preference.h>

#include <string>

#include <gtest/gtest.h>

namespace pelliko::test
{

class PrivateStore : public testing::Test
{
protected:
    PrivateStore();
    /// Where the values of an application lie.
    static std::string fileOf(const std::string &applicationId);
};

} // namespace pelliko::test
