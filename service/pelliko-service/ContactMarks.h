// The numbers of the contacts store and their marks
#pragma once

#include <functional>
#include <string>
#include <vector>

namespace pelliko::service
{

/** A number of the contacts store. */
struct ContactNumber {
    int id = 0;
    std::string e164; ///< its one form, never empty
    bool marked = false;
};

/** A mark that is to be set or taken away. */
struct MarkChange {
    int numberId = 0;
    bool joined = false;
};

/** The contacts store. Belongs to the main loop; answers come from there, never from inside. */
class ContactMarks
{
public:
    virtual ~ContactMarks() = default;

    /** Reads every number that is a phone number. @param ownNumber gives the country of those
     * without one @param done receives false when the store cannot be read */
    virtual void
    read(const std::string &ownNumber,
         std::function<void(bool read, const std::vector<ContactNumber> &numbers)> done) = 0;

    /** @param done receives whether all are written */
    virtual void write(const std::vector<MarkChange> &changes, std::function<void(bool)> done) = 0;
};

} // namespace pelliko::service
