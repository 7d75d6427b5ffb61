#include "shares/ShareRules.h"

#include "http/Errors.h"
#include "shares/ShareJson.h"

#include <gtest/gtest.h>

#include <functional>
#include <limits>

namespace pelliko::server
{
namespace
{

/// The name of the refusal that `work` ends with, or "" when it does not.
std::string refusalOf(const std::function<void()> &work)
{
    try {
        work();
    } catch (const Refusal &refusal) {
        return refusal.entry().name;
    }
    return "";
}

std::vector<NewFile> files(std::size_t count, std::uint64_t size)
{
    return std::vector<NewFile>(count, NewFile{"a", "", size});
}

TEST(ShareRules, LimitsHoldExactly)
{
    const Limits limits;
    const auto check = [&](const std::vector<NewFile> &list) {
        return refusalOf([&] { checkFiles(list, limits); });
    };
    EXPECT_EQ(check(files(100, 1)), "");
    EXPECT_EQ(check(files(101, 1)), "too_many_files");
    EXPECT_EQ(check(files(0, 0)), "bad_request");
    EXPECT_EQ(check(files(1, 1073741824)), "");
    EXPECT_EQ(check(files(1, 1073741825)), "share_too_large");
    EXPECT_EQ(check(files(2, 536870912)), "");
    // Two sizes whose sum wraps to zero.
    EXPECT_EQ(check(files(2, std::uint64_t{1} << 63)), "share_too_large");
    EXPECT_EQ(check(files(1, std::numeric_limits<std::uint64_t>::max())), "share_too_large");
}

TEST(ShareRules, RecipientsArePhoneNumbers)
{
    const auto check = [](const char *number) {
        return refusalOf([&] { checkRecipients({{number, ""}}, Limits{}); });
    };
    for (const char *good : {"+4915112345678", "0151 123-45", "(089) 1234", "110"})
        EXPECT_EQ(check(good), "") << good;
    for (const char *bad : {"", "+", "anna", "1\r\n2", "<b>1</b>"})
        EXPECT_EQ(check(bad), "bad_request") << bad;
    EXPECT_EQ(refusalOf([] { checkRecipients({}, Limits{}); }), "bad_request");
    EXPECT_EQ(refusalOf([] {
                  checkRecipients(std::vector<Recipient>(101, {"110", ""}), Limits{});
              }),
              "bad_request");
}

TEST(ShareRules, IdempotencyKeysAreVisible)
{
    EXPECT_EQ(refusalOf([] { checkIdempotencyKey(std::string(64, '~')); }), "");
    for (const std::string &bad :
         {std::string(), std::string(65, 'a'), std::string("a b"), std::string("\xc3\xbc")})
        EXPECT_EQ(refusalOf([&] { checkIdempotencyKey(bad); }), "bad_request") << bad;
}

TEST(ShareJson, RequestsOfAnyWrongKindAreRefused)
{
    const char *const wrong[] = {
        "",
        "[]",
        "{",
        "null",
        "{}",
        R"({"files":[],"recipients":{}})",
        R"({"files":{},"recipients":[]})",
        R"({"files":[1],"recipients":[]})",
        R"({"files":[{"name":"a"}],"recipients":[]})",
        R"({"files":[{"name":"a","size":-1}],"recipients":[]})",
        R"({"files":[{"name":"a","size":1.5}],"recipients":[]})",
        R"({"files":[{"name":"a","size":"1"}],"recipients":[]})",
        R"({"files":[{"name":"a","size":18446744073709551616}],"recipients":[]})",
        R"({"files":[{"name":1,"size":1}],"recipients":[]})",
        R"({"files":[{"size":1}],"recipients":[]})",
        R"({"files":[{"name":"a","size":1}]})",
        R"({"files":[{"name":"a","size":1}],"recipients":[{}]})",
        R"({"files":[{"name":"a","size":1}],"recipients":["110"]})",
        R"({"reshare_of":7,"recipients":[]})",
        "{\"files\":[{\"name\":\"\xfc\",\"size\":1}],\"recipients\":[]}",
    };
    for (const char *json : wrong)
        EXPECT_EQ(refusalOf([&] { (void)parseShareRequest(json); }), "bad_request") << json;
}

TEST(ShareJson, UnknownMembersAreIgnored)
{
    const ShareRequest request = parseShareRequest(
        R"({"x":{},"files":[{"name":"d/a","size":1,"y":2}],"recipients":[{"number":"110"}]})");
    ASSERT_EQ(request.files.size(), 1U);
    EXPECT_EQ(request.files[0].name, "a");
    EXPECT_EQ(request.files[0].type, "application/octet-stream");
    EXPECT_EQ(request.recipients.at(0).number, "110");
}

} // namespace
} // namespace pelliko::server
