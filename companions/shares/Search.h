// Finding people by what was typed.
#pragma once

#include <string>
#include <vector>

namespace pelliko::companion
{

/// A text for comparing: without case, accents and other marks above or below letters, and with one
/// form for letters that can be composed.
std::string foldedText(const std::string &text);

/// The digits of a text, of any script, as 0 to 9, and its plus signs.
std::string digitsOf(const std::string &text);

/// What was typed, ready to be compared with many people.
class Search
{
public:
    explicit Search(const std::string &typed);

    /// Whether each typed word is in the name, or the typed digits are in the number: also when one
    /// of the two has the country's code and the other the zero that stands for it at home.
    bool finds(const std::string &name, const std::string &number) const;
    /// The same with what foldedText() and digitsOf() made of them: many people are found faster.
    bool findsFolded(const std::string &name, const std::string &digits) const;

private:
    bool isInNumber(const std::string &digits) const;

    std::vector<std::string> words_;
    std::string digits_;
};

} // namespace pelliko::companion
