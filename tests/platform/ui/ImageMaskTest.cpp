#include "efl_assist.h"

#include <cstdint>
#include <gtest/gtest.h>
#include <string>
#include <vector>

namespace
{

constexpr const char *roundMask =
    PELLIKO_BUILD_DIR "/app/res/images/sender-images/WVGA/pk_caller_id_default_masking.png";

class ImageMask : public ::testing::Test
{
protected:
    static void SetUpTestSuite() { elm_init(0, nullptr); }
    ImageMask() { win = elm_win_util_standard_add("mask", "mask"); }
    ~ImageMask() override { evas_object_del(win); }

    // A file of one colour, as a person's photo would be.
    std::string photo(int width, int height)
    {
        Evas_Object *image = evas_object_image_filled_add(evas_object_evas_get(win));
        evas_object_image_size_set(image, width, height);
        std::vector<uint32_t> red(static_cast<size_t>(width * height), 0xffff0000);
        evas_object_image_data_copy_set(image, red.data());
        const std::string path =
            "/tmp/photo" + std::to_string(width) + "x" + std::to_string(height) + ".png";
        EXPECT_TRUE(evas_object_image_save(image, path.c_str(), nullptr, nullptr));
        evas_object_del(image);
        return path;
    }

    Evas_Object *imageOf(const std::string &path)
    {
        Evas_Object *image = elm_image_add(win);
        EXPECT_TRUE(elm_image_file_set(image, path.c_str(), nullptr));
        return image;
    }

    static uint32_t pixel(const Evas_Object *image, int x, int y)
    {
        const Evas_Object *shown = elm_image_object_get(image);
        const int stride = evas_object_image_stride_get(shown) / 4;
        return static_cast<const uint32_t *>(
            evas_object_image_data_get(shown, EINA_FALSE))[y * stride + x];
    }

    static std::string sizeOf(const Evas_Object *image)
    {
        int width = 0, height = 0;
        evas_object_image_size_get(elm_image_object_get(image), &width, &height);
        return std::to_string(width) + "x" + std::to_string(height);
    }

    Evas_Object *win = nullptr;
};

TEST_F(ImageMask, RoundMaskCutsTheCornersAndKeepsTheMiddle)
{
    Evas_Object *image = imageOf(photo(400, 400));
    EXPECT_TRUE(ea_image_mask_set(image, roundMask));
    EXPECT_EQ(sizeOf(image), "400x400");
    EXPECT_EQ(pixel(image, 200, 200), 0xffff0000U);
    EXPECT_EQ(pixel(image, 200, 6), 0xffff0000U);
    EXPECT_EQ(pixel(image, 0, 0), 0U);
    EXPECT_EQ(pixel(image, 399, 399), 0U);
    EXPECT_EQ(pixel(image, 40, 40), 0U);
}

TEST_F(ImageMask, WidePictureIsCutToTheMasksProportions)
{
    Evas_Object *image = imageOf(photo(300, 100));
    EXPECT_TRUE(ea_image_mask_set(image, roundMask));
    EXPECT_EQ(sizeOf(image), "100x100");
    EXPECT_EQ(pixel(image, 50, 50), 0xffff0000U);
    EXPECT_EQ(pixel(image, 1, 1), 0U);
}

TEST_F(ImageMask, UnreadableMaskLeavesThePictureAlone)
{
    Evas_Object *image = imageOf(photo(40, 40));
    EXPECT_FALSE(ea_image_mask_set(image, "/nowhere.png"));
    EXPECT_FALSE(ea_image_mask_set(image, nullptr));
    EXPECT_FALSE(ea_image_mask_set(nullptr, roundMask));
    EXPECT_EQ(pixel(image, 0, 0), 0xffff0000U);
}

TEST_F(ImageMask, PictureWithoutPixelsIsRefused)
{
    EXPECT_FALSE(ea_image_mask_set(elm_image_add(win), roundMask));
}

} // namespace
