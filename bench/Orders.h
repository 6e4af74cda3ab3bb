#pragma once

// Generated documents of nested orders, and the mapping they are read under.

#include <QXXMLMarshalling/model/Class.h>

#include <string>
#include <vector>

namespace bench {

// What they are read into where these are described.
struct Line {
    int quantity = 0;
    std::string article, title;
    double price = 0;
};
struct Address {
    std::string name, street, city, country;
};
struct Order {
    std::string number, date, remark;
    Address shipTo;
    std::vector<Line> lines;
};
struct Orders {
    std::vector<Order> orders;
};

// Describes them for the time of a scope.
class Described {
public:
    Described();
    ~Described();
};

// About that many bytes of orders, each with an address, attributes and a handful of lines.
std::string orders(std::size_t bytes);

// The mapping of such documents, every field of a usual kind.
extern const char* const orderMapping;

} // namespace bench
