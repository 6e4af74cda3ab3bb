#pragma once

// Guards the printing of object graphs: a graph that is too deep, or that leads back to an object
// which is being printed, is cut short.

#include <QXXMLMarshalling/model/Object.h>

namespace qx {

class Printing {
public:
    explicit Printing(const Object& object);
    ~Printing();
    Printing(const Printing&) = delete;
    Printing& operator=(const Printing&) = delete;

    // False: print `…` in the object's place.
    bool mayDescend() const noexcept { return _entered; }

    static constexpr std::size_t deepest = 256;
    static constexpr std::size_t blanksPerLevel = 4;
    static constexpr std::string_view cutShort = "...";

private:
    bool _entered;
};

// The blanks before a line of a list at that level.
inline std::string indentation(std::size_t level) {
    return std::string(level * Printing::blanksPerLevel, ' ');
}

} // namespace qx
