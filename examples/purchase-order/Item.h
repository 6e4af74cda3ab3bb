#pragma once

// An item of an order: the one class of mapping.xml that this program has in C++, since items are
// what it calculates with. Orders, parties, addresses and all else are records.

#include <QXXMLMarshalling/model/Class.h>
#include <QXXMLMarshalling/model/ValueTraits.h>

// An amount of money, exact to the cent; "12.50" in documents.
struct Money {
    std::int64_t cents = 0;

    std::string text() const;
    // False for what is no amount; the result is then untouched.
    static bool parse(std::string_view text, Money& result);
};

// Lets properties be amounts. What is refused here fails the reading of the document.
template <>
struct qx::ValueTraits<Money> {
    static Value toValue(const Money& money) { return money.text(); }
    static bool fromValue(const Value& value, Money& money) {
        return value.isString() && Money::parse(value.string(), money);
    }
};

class Item : public qx::Object {
public:
    Money total() const { return {price.cents * quantity}; }
    // Part of the order, and to be written with it.
    bool isRemovable() const { return false; }

    std::string article;
    std::string name;
    int quantity = 0;
    bool gift = false;
    Money price;
    // XML of the item's element that the mapping does not know.
    qx::Value unboundChildren, unboundAttributes, namespaces;
};

// Describes the class.
void registerItem();
