// The tree of numbered fields behind a msg_struct_t.
#pragma once

#include <map>
#include <memory>
#include <string>
#include <variant>
#include <vector>

namespace pelliko::messaging
{

enum class Kind { Int, Bool, Text, Part, List };

// A structure knows its fields from one table, so that a wrong field or a value of the wrong kind
// is refused.
class Structure
{
public:
    // Null for an unknown type.
    static std::unique_ptr<Structure> create(int type);

    Structure(const Structure &) = delete;
    Structure &operator=(const Structure &) = delete;

    int type() const { return type_; }
    // A part or list item belongs to the structure around it.
    bool isOwned() const { return owned_; }

    // The setters return false for a field that this structure does not have with that kind.
    bool setInt(int field, int value);
    bool setBool(int field, bool value);
    bool setText(int field, std::string value);
    bool setPart(int field, const Structure &value);

    // Borrowed from this structure; created empty at first use. Null for a wrong field.
    Structure *part(int field);
    // A new empty item at the end of a list field, borrowed. Null for a wrong field.
    Structure *addItem(int field);

    // Null when the field is unknown or was never set.
    const int *intValue(int field) const;
    const std::string *text(int field) const;
    const Structure *partIfSet(int field) const;
    std::vector<const Structure *> items(int field) const;

private:
    using Items = std::vector<std::unique_ptr<Structure>>;
    using Value = std::variant<int, bool, std::string, std::unique_ptr<Structure>, Items>;

    Structure(int type, bool owned) : type_(type), owned_(owned) {}
    std::unique_ptr<Structure> copyAsPart() const;

    int type_;
    bool owned_;
    std::map<int, Value> values_;
};

} // namespace pelliko::messaging
