// Reads a purchase order, tells what is in it, changes the quantity of an article and writes the
// order to another file: with all that this program knows nothing of. Without one the order's own
// file is changed, and nothing else in it.
//
//     example_purchase_order ORDER [NEW_ORDER] ARTICLE QUANTITY

#include "Item.h"

#include <QXXMLMarshalling/QXGenericRecord.h>
#include <QXXMLMarshalling/QXXMLUpdate.h>
#include <QXXMLMarshalling/host/Log.h>
#include <QXXMLMarshalling/model/Error.h>
#include <QXXMLMarshalling/model/Format.h>

#include <charconv>
#include <iostream>

// The library tells here what it keeps of a document beyond the mapping.
void QXLogDebug(std::string_view format, std::span<const qx::Value> arguments) {
    std::cout << "  library: " << qx::format(format, arguments).view() << '\n';
}
void QXLogWarning(std::string_view format, std::span<const qx::Value> arguments) {
    std::cout << "  library: " << qx::format(format, arguments).view() << '\n';
}

namespace {

std::string textOf(const qx::Object& object, qx::Key key) {
    return object.valueForKey(key).string().str();
}

template <class T>
std::vector<qx::Ref<T>> itemsOf(const qx::Object& object, qx::Key key) {
    std::vector<qx::Ref<T>> items;
    if (const auto array = object.valueForKey(key).as<qx::Array>())
        for (const qx::Value& item : *array)
            items.push_back(item.as<T>());
    return items;
}

void printAddress(const char* label, const qx::Value& value) {
    if (const auto address = value.as<QXGenericRecord>())
        std::cout << "  " << label << ' ' << address->get<std::string>("street").value_or("?")
                  << ", " << address->get<std::string>("city").value_or("?") << ", "
                  << address->get<std::string>("country").value_or("?") << '\n';
}

void printOrder(const qx::Object& order) {
    std::cout << "order " << textOf(order, "number") << " of " << textOf(order, "date") << ", from "
              << order.valueForKeyPath("buyer.name").string().view() << '\n';
    printAddress("living at", order.valueForKeyPath("buyer.address"));
    printAddress("to be sent to", order.valueForKey("shipTo"));

    Money total;
    for (const auto& item : itemsOf<Item>(order, "items")) {
        std::cout << "  " << item->quantity << " x " << item->article << " (" << item->name
                  << ") at " << item->price.text() << ": " << item->total().text()
                  << (item->gift ? ", wrapped as a gift" : "") << '\n';
        total.cents += item->total().cents;
    }
    const std::string currency = textOf(order, "currency");
    std::cout << "  total " << total.text() << (currency.empty() ? "" : " ") << currency << '\n';

    if (const auto history = order.valueForKey("history").as<qx::Object>())
        for (const auto& event : itemsOf<qx::Object>(*history, "events"))
            std::cout << "  " << event->classNameForMarshalling().view() << " on "
                      << textOf(*event, "on") << " by " << textOf(*event, "by") << '\n';
    for (const auto& remark : itemsOf<qx::Object>(order, "remarks"))
        std::cout << "  remark: " << textOf(*remark, "text") << '\n';
}

// False when the order has no such article.
bool changeQuantity(const qx::Object& order, std::string_view article, int quantity) {
    for (const auto& item : itemsOf<Item>(order, "items")) {
        if (item->article != article)
            continue;
        std::cout << "changed: " << item->quantity << " x " << article << " to " << quantity
                  << '\n';
        item->setValueForKey(quantity, "quantity");
        return true;
    }
    return false;
}

int fail(std::string_view message) {
    std::cout << "purchase-order: " << message << '\n';
    return 1;
}
int fail(const qx::Ref<qx::Error>& error) {
    return fail(error ? error->description().view() : "the document holds no order");
}

} // namespace

int main(int argc, char** argv) {
    int quantity = 0;
    const bool isAnother = argc == 5;
    const std::string_view number = argc == 4 || argc == 5 ? argv[argc - 1] : "";
    if (std::from_chars(number.data(), number.data() + number.size(), quantity).ec != std::errc()) {
        std::cerr << "usage: example_purchase_order ORDER [NEW_ORDER] ARTICLE QUANTITY\n";
        return 2;
    }
    registerItem();

    qx::Ref<qx::Error> error;
    const auto marshaller =
        QXXMLMarshaller::initWithMappingFile(QX_EXAMPLE_DIR "/mapping.xml", &error);
    if (!marshaller)
        return fail(error);
    const auto order = marshaller->readFile(argv[1], &error);
    if (!order)
        return fail(error);
    printOrder(*order);
    if (!changeQuantity(*order, argv[argc - 2], quantity))
        return fail("the order has no such article");
    if (!isAnother) {
        const auto update = QXXMLUpdate::updateFile(*marshaller, order, argv[1]);
        return update ? 0 : fail(update.error());
    }
    return marshaller->writeFile(order, argv[2], &error) ? 0 : fail(error);
}
