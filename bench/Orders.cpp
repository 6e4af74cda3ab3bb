#include "Orders.h"

namespace bench {

const char* const orderMapping = R"(<mapping>
  <class name="Orders"><map-to xml="orders"/>
    <field name="orders" type="Order" collection="array"><bind-xml name="order"/></field>
  </class>
  <class name="Order"><map-to xml="order"/>
    <field name="number"><bind-xml name="number" node="attribute"/></field>
    <field name="date"><bind-xml name="date" node="attribute"/></field>
    <field name="shipTo" type="Address"><bind-xml name="shipTo" node="element"/></field>
    <field name="remark"><bind-xml name="remark" node="element"/></field>
    <field name="lines" type="Line" collection="array">
      <bind-xml name="line" location="lines"/>
    </field>
  </class>
  <class name="Address"><map-to xml="address"/>
    <field name="name"><bind-xml name="name" node="element"/></field>
    <field name="street"><bind-xml name="street" node="element"/></field>
    <field name="city"><bind-xml name="city" node="element"/></field>
    <field name="country"><bind-xml name="country" node="attribute"/></field>
  </class>
  <class name="Line"><map-to xml="line"/>
    <field name="quantity" type="int"><bind-xml name="quantity" node="attribute"/></field>
    <field name="article"><bind-xml name="article" node="attribute"/></field>
    <field name="title"><bind-xml name="title" node="element"/></field>
    <field name="price"><bind-xml name="price" node="element"/></field>
  </class>
</mapping>)";

namespace {

void forgetAll() {
    for (const char* name : {"Line", "Address", "Order", "Orders"})
        qx::Class::forget(name);
}

} // namespace

Described::Described() {
    qx::Class::define<Line>("Line")
        .members<&Line::quantity, &Line::article, &Line::title, &Line::price>();
    qx::Class::define<Address>("Address")
        .members<&Address::name, &Address::street, &Address::city, &Address::country>();
    qx::Class::define<Order>("Order")
        .members<&Order::number, &Order::date, &Order::remark, &Order::shipTo, &Order::lines>();
    qx::Class::define<Orders>("Orders").members<&Orders::orders>();
}

Described::~Described() { forgetAll(); }

DescribedHosts::DescribedHosts() {
    qx::Class::define<HostLine>("Line")
        .member<&HostLine::quantity>("quantity")
        .member<&HostLine::article>("article")
        .member<&HostLine::title>("title")
        .member<&HostLine::price>("price");
    qx::Class::define<HostAddress>("Address")
        .member<&HostAddress::name>("name")
        .member<&HostAddress::street>("street")
        .member<&HostAddress::city>("city")
        .member<&HostAddress::country>("country");
    qx::Class::define<HostOrder>("Order")
        .members<&HostOrder::number, &HostOrder::date, &HostOrder::remark, &HostOrder::shipTo,
                 &HostOrder::lines>();
    qx::Class::define<HostOrders>("Orders").members<&HostOrders::orders>();
}

DescribedHosts::~DescribedHosts() { forgetAll(); }

namespace {

const char* const prologue = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n";

void append(std::string& xml, std::size_t i) {
    const std::string number = std::to_string(i);
    xml += "  <order number=\"A-" + number + "\" date=\"2026-03-" + std::to_string(10 + i % 18) +
           "\">\n    <shipTo country=\"DE\">\n      <name>Customer " + number +
           "</name>\n      <street>High Street " + std::to_string(i % 97) +
           "</street>\n      <city>Town &amp; Country</city>\n    </shipTo>\n"
           "    <remark>Leave at the door</remark>\n    <lines>\n";
    for (std::size_t line = 0; line < 3 + i % 5; ++line)
        xml += "      <line quantity=\"" + std::to_string(1 + line) + "\" article=\"" +
               std::to_string(100000 + (i * 7 + line) % 9999) + "\">\n        <title>Article " +
               std::to_string(line) + "</title>\n        <price>" + std::to_string(5 + line) +
               ".95</price>\n      </line>\n";
    xml += "    </lines>\n  </order>\n";
}

} // namespace

std::string orders(std::size_t bytes) {
    std::string xml = prologue + std::string("<orders>\n");
    for (std::size_t i = 0; xml.size() < bytes; ++i)
        append(xml, i);
    return xml + "</orders>\n";
}

std::string oneOrder(std::size_t number) {
    std::string xml = prologue;
    append(xml, number);
    return xml;
}

GeneratedOrders::GeneratedOrders(std::size_t bytes)
    : _block(prologue + std::string("<orders>\n")), _bytes(bytes) {
    show();
}

void GeneratedOrders::show() {
    setg(_block.data(), _block.data(), _block.data() + _block.size());
    _made += _block.size();
}

GeneratedOrders::int_type GeneratedOrders::underflow() {
    if (_hasEnded)
        return traits_type::eof();
    _block.clear();
    _hasEnded = _made >= _bytes;
    if (_hasEnded)
        _block = "</orders>\n";
    else
        append(_block, _next++);
    show();
    return traits_type::to_int_type(_block.front());
}

} // namespace bench
