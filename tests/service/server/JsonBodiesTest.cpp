#include "accounts/AccountJson.h"
#include "http/Errors.h"
#include "push/PushJson.h"

#include <gmock/gmock.h>

namespace pelliko::server
{
namespace
{

using testing::ElementsAre;

// As deep as the largest body of these calls can go.
std::string nested(const std::string &member)
{
    constexpr std::size_t levels = 32'000;
    return "{\"" + member + "\":" + std::string(levels, '[') + std::string(levels, ']') + "}";
}

TEST(JsonBodies, AQuestionNamesEachNumberOnce)
{
    EXPECT_THAT(parseNumbers(R"({"numbers":["+4915112345678","+447700900123","+4915112345678"]})",
                             Limits()),
                ElementsAre("+447700900123", "+4915112345678"));
}

TEST(JsonBodies, AnAcknowledgementIsAnId)
{
    EXPECT_EQ(parseAcknowledged(R"({"up_to":9223372036854775807})"), INT64_MAX);
    for (const char *body : {R"({"up_to":9223372036854775808})", R"({"up_to":-1})",
                             R"({"up_to":1.5})", R"({"up_to":"1"})", "{}", "[]", "", "{"})
        EXPECT_THROW((void)parseAcknowledged(body), Refusal) << body;
}

TEST(JsonBodies, ABodyNestedDeeplyIsRefused)
{
    EXPECT_THROW((void)parseNumbers(nested("numbers"), Limits()), Refusal);
    EXPECT_THROW((void)parseAcknowledged(nested("up_to")), Refusal);
    EXPECT_THROW((void)parseRegistration(nested("number")), Refusal);
}

} // namespace
} // namespace pelliko::server
