#pragma once

#include <initializer_list>
#include <string>
#include <utility>

namespace pelliko::test
{

/// A message catalogue of the application's text domain, in force while it lives.
class Catalogue
{
public:
    using Text = std::pair<const char *, const char *>; ///< message id, translation

    explicit Catalogue(std::initializer_list<Text> texts);
    ~Catalogue();
    Catalogue(const Catalogue &) = delete;
    Catalogue &operator=(const Catalogue &) = delete;

private:
    std::string directory_;
};

} // namespace pelliko::test
