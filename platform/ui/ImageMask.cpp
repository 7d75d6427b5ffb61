#include "efl_assist.h"

#include <algorithm>
#include <cmath>
#include <cstdint>
#include <memory>
#include <vector>

// The mask is worked into the picture's own pixels, at the picture's own size: a clipping object
// would have to be moved, scaled and clipped with every widget around the picture.

namespace
{

struct Pixels {
    int width = 0;
    int height = 0;
    std::vector<uint32_t> data; ///< premultiplied ARGB, rows without gaps

    bool empty() const { return data.empty(); }
};

using ImageHolder = std::unique_ptr<Evas_Object, decltype(&evas_object_del)>;

Pixels pixelsOf(Evas_Object *image)
{
    Pixels pixels;
    evas_object_image_size_get(image, &pixels.width, &pixels.height);
    const int stride = evas_object_image_stride_get(image) / 4;
    if (pixels.width <= 0 || pixels.height <= 0 || stride < pixels.width ||
        evas_object_image_load_error_get(image) != EVAS_LOAD_ERROR_NONE)
        return {};
    void *raw = evas_object_image_data_get(image, EINA_FALSE);
    if (!raw)
        return {};
    const auto *row = static_cast<const uint32_t *>(raw);
    for (int y = 0; y < pixels.height; ++y, row += stride)
        pixels.data.insert(pixels.data.end(), row, row + pixels.width);
    evas_object_image_data_set(image, raw);
    // Without an alpha channel the top byte is undefined.
    if (!evas_object_image_alpha_get(image)) {
        for (uint32_t &pixel : pixels.data)
            pixel |= 0xff000000U;
    }
    return pixels;
}

Pixels loadMask(Evas *canvas, const char *path)
{
    const ImageHolder file(evas_object_image_add(canvas), evas_object_del);
    evas_object_image_file_set(file.get(), path, nullptr);
    return pixelsOf(file.get());
}

// The largest part of `picture` around its middle that has the mask's proportions.
Pixels cropToProportions(const Pixels &picture, const Pixels &mask)
{
    Pixels part;
    const double wanted = static_cast<double>(mask.width) / mask.height;
    part.width = std::min(picture.width, static_cast<int>(std::lround(picture.height * wanted)));
    part.height = std::min(picture.height, static_cast<int>(std::lround(picture.width / wanted)));
    part.width = std::max(part.width, 1);
    part.height = std::max(part.height, 1);
    const int left = (picture.width - part.width) / 2, top = (picture.height - part.height) / 2;
    for (int y = 0; y < part.height; ++y) {
        const auto row = picture.data.begin() + (top + y) * picture.width + left;
        part.data.insert(part.data.end(), row, row + part.width);
    }
    return part;
}

// Alpha, 0 to 255, of the mask at a point given in mask pixels, between its pixels' middles.
double alphaAt(const Pixels &mask, double x, double y)
{
    x = std::clamp(x, 0.0, mask.width - 1.0);
    y = std::clamp(y, 0.0, mask.height - 1.0);
    const int x0 = static_cast<int>(x), y0 = static_cast<int>(y);
    const int x1 = std::min(x0 + 1, mask.width - 1), y1 = std::min(y0 + 1, mask.height - 1);
    const auto alpha = [&mask](int px, int py) -> double {
        return mask.data[static_cast<size_t>(py) * static_cast<size_t>(mask.width) +
                         static_cast<size_t>(px)] >>
               24;
    };
    const double upper = alpha(x0, y0) + (alpha(x1, y0) - alpha(x0, y0)) * (x - x0);
    const double lower = alpha(x0, y1) + (alpha(x1, y1) - alpha(x0, y1)) * (x - x0);
    return upper + (lower - upper) * (y - y0);
}

uint32_t faded(uint32_t pixel, uint32_t alpha)
{
    uint32_t result = 0;
    for (int shift = 0; shift < 32; shift += 8)
        result |= (((pixel >> shift & 0xffU) * alpha + 127U) / 255U) << shift;
    return result;
}

void applyMask(Pixels &picture, const Pixels &mask)
{
    const double across = static_cast<double>(mask.width) / picture.width;
    const double down = static_cast<double>(mask.height) / picture.height;
    auto pixel = picture.data.begin();
    for (int y = 0; y < picture.height; ++y) {
        for (int x = 0; x < picture.width; ++x, ++pixel) {
            const double alpha = alphaAt(mask, (x + 0.5) * across - 0.5, (y + 0.5) * down - 0.5);
            *pixel = faded(*pixel, static_cast<uint32_t>(std::lround(alpha)));
        }
    }
}

void showPixels(Evas_Object *image, const Pixels &pixels)
{
    evas_object_image_file_set(image, nullptr, nullptr);
    evas_object_image_colorspace_set(image, EVAS_COLORSPACE_ARGB8888);
    evas_object_image_alpha_set(image, EINA_TRUE);
    evas_object_image_size_set(image, pixels.width, pixels.height);
    auto *target = static_cast<uint32_t *>(evas_object_image_data_get(image, EINA_TRUE));
    if (!target)
        return;
    const int stride = evas_object_image_stride_get(image) / 4;
    for (int y = 0; y < pixels.height; ++y)
        std::copy_n(pixels.data.begin() + y * pixels.width, pixels.width, target + y * stride);
    evas_object_image_data_set(image, target);
    evas_object_image_data_update_add(image, 0, 0, pixels.width, pixels.height);
}

} // namespace

Eina_Bool ea_image_mask_set(Evas_Object *image, const char *mask_path)
{
    if (!image || !mask_path)
        return EINA_FALSE;
    Evas_Object *shown = elm_object_widget_check(image) ? elm_image_object_get(image) : image;
    if (!shown)
        return EINA_FALSE;
    const Pixels mask = loadMask(evas_object_evas_get(image), mask_path);
    const Pixels whole = pixelsOf(shown);
    if (mask.empty() || whole.empty())
        return EINA_FALSE;
    Pixels picture = cropToProportions(whole, mask);
    applyMask(picture, mask);
    showPixels(shown, picture);
    return EINA_TRUE;
}
