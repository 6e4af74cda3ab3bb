#pragma once

// The plain structs, and the classes beside them, that the tests of structs share.

#include "support/Scenario.h"

#include <QXXMLMarshalling/QXXMLMarshalling.h>

#include <memory>
#include <optional>
#include <string>
#include <vector>

namespace structs {

struct Place {
    std::string city;
    int zip = 0;
    bool operator==(const Place&) const = default;
};

struct Shape {
    Shape() = default;
    Shape(Shape&&) = default;
    Shape& operator=(Shape&&) = default;
    virtual ~Shape() = default;
    std::string label;
};
struct Padding {
    virtual ~Padding() = default;
    double padding = 0;
};
struct Circle : Padding, Shape {
    double radius = 0;
};

struct Tree {
    std::string name;
    std::vector<Tree> branches;
    std::unique_ptr<Tree> graft;
    bool operator==(const Tree& other) const {
        return name == other.name && branches == other.branches && !graft == !other.graft &&
               (!graft || *graft == *other.graft);
    }
};

class Owner : public qx::Object {
public:
    std::string name;
    bool isRemovable() const { return false; }
    QXUnknownXML unknown;
};

// A class of the library's with optional members.
class Counted : public qx::Object {
public:
    std::optional<int> zero;
    std::optional<double> cut;
    int plain = 0;
    Place place;
    QXUnknownXML unknown;
};

template <class Result>
std::string errorOf(const Result& result) {
    return support::told(result.error());
}

inline std::string attributeField(const std::string& name) {
    return "<field name='" + name + "'><bind-xml node='attribute'/></field>";
}

// Of the classes here.
inline std::string mapping() {
    return "<class name='Place'>" + attributeField("city") + attributeField("zip") +
           "</class><class name='Owner'>" + attributeField("name") +
           "</class><class name='Shape'><map-to xml='shape'/>" + attributeField("label") +
           "</class><class name='Circle' extends='Shape'><map-to xml='circle'/>" +
           attributeField("radius") + "</class><class name='Tree'><map-to xml='tree'/>" +
           attributeField("name") +
           "<field name='branches' type='Tree' collection='array'><bind-xml name='branch'/>"
           "</field><field name='graft' type='Tree'><bind-xml node='element'/></field></class>"
           "<class name='Nobody'/><class name='Counted'>" +
           attributeField("zero") + attributeField("cut") + attributeField("plain") + "</class>";
}

// Describes the classes here, for a marshaller that maps them and `classes`.
class Structs : public testing::Test {
protected:
    explicit Structs(const std::string& classes = "")
        : marshaller(scenario::marshaller(classes + mapping())) {}

    void SetUp() override {
        qx::Class::define<Place>("Place").members<&Place::city, &Place::zip>();
        qx::Class::define<Shape>("Shape").members<&Shape::label>();
        qx::Class::define<Circle, Shape>("Circle").members<&Circle::radius>();
        qx::Class::define<Tree>("Tree").members<&Tree::name, &Tree::branches, &Tree::graft>();
        qx::Class::define<Owner>("Owner")
            .members<&Owner::name, &Owner::unknown>()
            .operation<&Owner::isRemovable>("isRemovable");
        qx::Class::define<Counted>("Counted")
            .members<&Counted::zero, &Counted::cut, &Counted::plain, &Counted::place,
                     &Counted::unknown>();
    }
    void TearDown() override {
        for (const char* name : {"Place", "Shape", "Circle", "Tree", "Owner", "Counted"})
            qx::Class::forget(name);
    }

    qx::Ref<QXXMLMarshaller> marshaller;
};

} // namespace structs
