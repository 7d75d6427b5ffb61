// What the command says, and with which status it ends.
#pragma once

#include <string>

namespace pelliko::command
{

/// Exit statuses; people's scripts rely on them.
enum class Exit {
    done = 0,
    failed = 1,
    usage = 2,
    /// A recipient is nobody, or could be several people.
    recipient = 3,
    /// Pelliko or its upload service cannot be reached.
    unreachable = 4
};

/// Prints "pelliko: sentence" to standard error and gives the status back.
Exit refuse(Exit status, const std::string &sentence);

/// Brings what was printed out; failed when it could not be written.
Exit finish();

/// Whether standard output is read by a person: columns are then aligned.
bool forPeople();

/// The text with blanks behind it up to so many columns of a terminal.
std::string padded(const std::string &text, int columns);

/// Columns that a text takes on a terminal.
int columnsOf(const std::string &text);

/// The text with what could steer a terminal (control characters) and what is not UTF-8 replaced.
std::string printable(const std::string &text);

} // namespace pelliko::command
