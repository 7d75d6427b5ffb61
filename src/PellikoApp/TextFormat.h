#pragma once

#include <cstddef>

// Texts from the message catalogues, and numbers that are printed the same way in every language.

namespace pelliko
{

/// The translation of a message id ("IDS_…") in the current language, or the id itself when there
/// is none. Borrowed, never null.
const char *translated(const char *id);

/// Copies `text` (null: empty) into a buffer of `size` bytes, cut between characters, always
/// terminated.
void copyText(char *buffer, size_t size, const char *text);

/// Cuts `text`, which was cut at some byte, back to its last whole UTF-8 character.
void dropBrokenCharacter(char *text);

/// Prints a text of the catalogues that holds conversions. A translation is data, so its
/// conversions are compared with the arguments first: a format that asks for anything else is
/// copied as it stands. The result is cut between characters and always terminated.
/// @param kinds the arguments that follow, one letter each: 'd' int, 's' const char * (not null),
///              'f' double; the format may use them in any order ("%2$s") and leave out the last
void formatTranslated(char *buffer, size_t size, const char *format, const char *kinds, ...);

/// While it lives, this thread prints and reads numbers with a decimal point whatever the user's
/// language is.
class PlainNumbers
{
public:
    PlainNumbers();
    ~PlainNumbers();
    PlainNumbers(const PlainNumbers &) = delete;
    PlainNumbers &operator=(const PlainNumbers &) = delete;

private:
    void *previous_;
};

} // namespace pelliko
