#include <bundle.h>

#include <gtest/gtest.h>

namespace
{

class Bundle : public testing::Test
{
protected:
    ~Bundle() override { bundle_free(made); }

    std::string text(bundle *from, const char *key) const
    {
        char *value = nullptr;
        return bundle_get_str(from, key, &value) == BUNDLE_ERROR_NONE ? value : "(absent)";
    }

    bundle *made = bundle_create();
};

} // namespace

TEST_F(Bundle, KeepsCopiesOfKeysAndTexts)
{
    std::string key = "app_id";
    std::string value = "com.velmora.pelliko";
    EXPECT_EQ(BUNDLE_ERROR_NONE, bundle_add_str(made, key.c_str(), value.c_str()));
    key = "other";
    value = "gone";
    EXPECT_EQ("com.velmora.pelliko", text(made, "app_id"));
    EXPECT_EQ(1, bundle_get_count(made));
}

TEST_F(Bundle, LendsTheSameTextEveryTime)
{
    bundle_add_str(made, "feature", "PK01");
    char *first = nullptr;
    char *second = nullptr;
    bundle_get_str(made, "feature", &first);
    bundle_add_str(made, "extra", "x");
    bundle_get_str(made, "feature", &second);
    EXPECT_EQ(first, second);
}

TEST_F(Bundle, AnExistingKeyKeepsItsText)
{
    bundle_add_str(made, "feature", "PK01");
    EXPECT_EQ(TIZEN_ERROR_BUNDLE | 0x01, bundle_add_str(made, "feature", "PK02"));
    EXPECT_EQ("PK01", text(made, "feature"));
}

TEST_F(Bundle, AnAbsentKeyLeavesTheOutputAlone)
{
    char *value = made ? reinterpret_cast<char *>(made) : nullptr;
    char *const before = value;
    EXPECT_EQ(BUNDLE_ERROR_KEY_NOT_AVAILABLE, bundle_get_str(made, "nothing", &value));
    EXPECT_EQ(before, value);
}

TEST_F(Bundle, ACopyLivesOnItsOwn)
{
    bundle_add_str(made, "feature", "PK01");
    bundle *copy = bundle_dup(made);
    bundle_add_str(made, "extra", "x");
    bundle_free(made);
    made = nullptr;
    EXPECT_EQ("PK01", text(copy, "feature"));
    EXPECT_EQ(1, bundle_get_count(copy));
    bundle_free(copy);
}

TEST_F(Bundle, RefusesNothingness)
{
    char *value = nullptr;
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_add_str(nullptr, "k", "v"));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_add_str(made, nullptr, "v"));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_add_str(made, "", "v"));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_add_str(made, "k", nullptr));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_get_str(nullptr, "k", &value));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_get_str(made, "k", nullptr));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, bundle_free(nullptr));
    EXPECT_EQ(nullptr, bundle_dup(nullptr));
    EXPECT_EQ(BUNDLE_ERROR_INVALID_PARAMETER, get_last_result());
    EXPECT_EQ(0, bundle_get_count(nullptr));
}
