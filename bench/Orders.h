#pragma once

// Generated documents of nested orders, the mapping they are read under, and what they are read
// into.

#include <QXXMLMarshalling/model/Class.h>

#include <streambuf>
#include <string>
#include <vector>

namespace bench {

// Plain structs, for the library where these are described, and for its peers.
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

// Describes the structs for the time of a scope.
class Described {
public:
    Described();
    ~Described();
};

// The same as host classes, whose objects are shared.
struct HostLine : qx::Object, Line {};
struct HostAddress : qx::Object, Address {};
struct HostOrder : qx::Object {
    std::string number, date, remark;
    qx::Ref<HostAddress> shipTo;
    std::vector<qx::Ref<HostLine>> lines;
};
struct HostOrders : qx::Object {
    std::vector<qx::Ref<HostOrder>> orders;
};

// Describes these for the time of a scope.
class DescribedHosts {
public:
    DescribedHosts();
    ~DescribedHosts();
};

// About that many bytes of orders, each with an address, attributes and a handful of lines.
std::string orders(std::size_t bytes);

// A document of one order alone, of about 0.9 kB.
std::string oneOrder(std::size_t number);

// The bytes of orders(), made while they are read: a stream over it holds one order at a time.
class GeneratedOrders final : public std::streambuf {
public:
    explicit GeneratedOrders(std::size_t bytes);

protected:
    int_type underflow() override;

private:
    void show();

    std::string _block;
    std::size_t _bytes;
    std::size_t _made = 0;
    std::size_t _next = 0;
    bool _hasEnded = false;
};

// The mapping of such documents, every field of a usual kind.
extern const char* const orderMapping;

} // namespace bench
