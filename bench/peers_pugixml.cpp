// The orders by hand over pugixml: its tree, the tree read into structs, structs written.

#include "Beside.h"
#include "Peak.h"

#include <pugixml.hpp>

namespace {

using namespace bench;

Order orderOf(const pugi::xml_node& node) {
    Order order;
    order.number = node.attribute("number").value();
    order.date = node.attribute("date").value();
    order.remark = node.child_value("remark");
    const pugi::xml_node shipTo = node.child("shipTo");
    order.shipTo.name = shipTo.child_value("name");
    order.shipTo.street = shipTo.child_value("street");
    order.shipTo.city = shipTo.child_value("city");
    order.shipTo.country = shipTo.attribute("country").value();
    for (const pugi::xml_node& line : node.child("lines").children("line"))
        order.lines.push_back({line.attribute("quantity").as_int(),
                               line.attribute("article").value(), line.child_value("title"),
                               line.child("price").text().as_double()});
    return order;
}

Orders ordersOf(const pugi::xml_document& document) {
    Orders orders;
    for (const pugi::xml_node& order : document.child("orders").children("order"))
        orders.orders.push_back(orderOf(order));
    return orders;
}

void appendText(pugi::xml_node& parent, const char* name, const std::string& text) {
    parent.append_child(name).text().set(text.c_str());
}

void append(pugi::xml_node& parent, const Order& order) {
    pugi::xml_node node = parent.append_child("order");
    node.append_attribute("number") = order.number.c_str();
    node.append_attribute("date") = order.date.c_str();
    pugi::xml_node shipTo = node.append_child("shipTo");
    shipTo.append_attribute("country") = order.shipTo.country.c_str();
    appendText(shipTo, "name", order.shipTo.name);
    appendText(shipTo, "street", order.shipTo.street);
    appendText(shipTo, "city", order.shipTo.city);
    appendText(node, "remark", order.remark);
    pugi::xml_node lines = node.append_child("lines");
    for (const Line& line : order.lines) {
        pugi::xml_node child = lines.append_child("line");
        child.append_attribute("quantity") = line.quantity;
        child.append_attribute("article") = line.article.c_str();
        appendText(child, "title", line.title);
        child.append_child("price").text().set(line.price);
    }
}

// Keeps what is printed.
struct Text final : pugi::xml_writer {
    void write(const void* data, std::size_t size) override {
        text.append(static_cast<const char*>(data), size);
    }
    std::string text;
};

void pugixmlTree(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    besideUnit(state, xml, [&] {
        pugi::xml_document tree;
        return static_cast<bool>(tree.load_buffer(xml.data(), xml.size()));
    });
}
void pugixmlStructs(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    besideUnit(state, xml, [&] {
        pugi::xml_document tree;
        return tree.load_buffer(xml.data(), xml.size()) && !ordersOf(tree).orders.empty();
    });
}
void pugixmlWrite(benchmark::State& state) {
    const std::string& xml = document(state.range(0));
    pugi::xml_document read;
    read.load_buffer(xml.data(), xml.size());
    const Orders orders = ordersOf(read);
    read.reset();
    besideUnit(state, xml, [&] {
        pugi::xml_document tree;
        pugi::xml_node root = tree.append_child("orders");
        for (const Order& order : orders.orders)
            append(root, order);
        Text text;
        tree.save(text, "  ");
        return !text.text.empty();
    });
}

bool readFile(std::size_t bytes) {
    const OrdersFile file(bytes);
    pugi::xml_document tree;
    return tree.load_file(file.path().c_str()) && !ordersOf(tree).orders.empty();
}
const PeakWork pugixmlPeak("pugixmlStructs", readFile, {60});

BENCHMARK(pugixmlTree)->Apply(once);
BENCHMARK(pugixmlStructs)->Apply(sizes);
BENCHMARK(pugixmlWrite)->Apply(once);

} // namespace
