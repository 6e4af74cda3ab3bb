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

Described::Described() {
    qx::Class::define<Line>("Line")
        .members<&Line::quantity, &Line::article, &Line::title, &Line::price>();
    qx::Class::define<Address>("Address")
        .members<&Address::name, &Address::street, &Address::city, &Address::country>();
    qx::Class::define<Order>("Order")
        .members<&Order::number, &Order::date, &Order::remark, &Order::shipTo, &Order::lines>();
    qx::Class::define<Orders>("Orders").members<&Orders::orders>();
}

Described::~Described() {
    for (const char* name : {"Line", "Address", "Order", "Orders"})
        qx::Class::forget(name);
}

std::string orders(std::size_t bytes) {
    std::string xml = "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<orders>\n";
    for (std::size_t i = 0; xml.size() < bytes; ++i) {
        const std::string number = std::to_string(i);
        xml += "  <order number=\"A-" + number + "\" date=\"2026-03-" +
               std::to_string(10 + i % 18) +
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
    return xml + "</orders>\n";
}

} // namespace bench
