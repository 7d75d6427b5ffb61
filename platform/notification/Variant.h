// Shared ownership of a GVariant.
#pragma once

#include <utility>

#include <glib.h>

namespace pelliko::notification
{

class Variant
{
public:
    Variant() = default;
    // Takes a floating reference over; a null pointer is fine.
    explicit Variant(GVariant *floating) : value_(floating ? g_variant_ref_sink(floating) : nullptr)
    {
    }
    // Takes over a full reference, as functions that return a GVariant to the caller give it.
    static Variant adopt(GVariant *full)
    {
        Variant result;
        result.value_ = full ? g_variant_take_ref(full) : nullptr;
        return result;
    }
    Variant(const Variant &other) : value_(other.value_ ? g_variant_ref(other.value_) : nullptr) {}
    Variant(Variant &&other) noexcept : value_(std::exchange(other.value_, nullptr)) {}
    Variant &operator=(Variant other) noexcept
    {
        std::swap(value_, other.value_);
        return *this;
    }
    ~Variant()
    {
        if (value_)
            g_variant_unref(value_);
    }

    GVariant *get() const { return value_; }
    explicit operator bool() const { return value_ != nullptr; }

private:
    GVariant *value_ = nullptr;
};

} // namespace pelliko::notification
