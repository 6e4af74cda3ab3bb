#pragma once

// Settings of a drawing program. Its palette holds shapes of several classes, by pointers to what
// they have in common, and a shape's fill is one of two classes in a variant.

#include <QXXMLMarshalling/QXUnknownXML.h>

#include <memory>
#include <variant>

namespace settings {

struct Plain {
    std::string colour;
    QXUnknownXML unknown;
};
struct Gradient {
    std::string from, to;
    QXUnknownXML unknown;
};

struct Shape {
    virtual ~Shape() = default;
    virtual double area() const = 0;
    virtual void scale(double factor) = 0;

    std::string name;
    std::variant<std::monostate, Plain, Gradient> fill;
    QXUnknownXML unknown;
};
struct Circle : Shape {
    double area() const override;
    void scale(double factor) override;

    double radius = 0;
};
struct Rectangle : Shape {
    double area() const override;
    void scale(double factor) override;

    double width = 0, height = 0;
    std::optional<double> corner;
};
struct Point {
    double x = 0, y = 0;
    QXUnknownXML unknown;
};
struct Path : Shape { // from point to point, and back to the first
    double area() const override;
    void scale(double factor) override;

    std::vector<Point> points;
};
struct Group : Shape {
    double area() const override;
    void scale(double factor) override;

    std::vector<std::unique_ptr<Shape>> shapes;
};

struct Settings {
    double grid = 0;
    std::vector<std::unique_ptr<Shape>> palette;
    QXUnknownXML unknown;
};

void describeClasses();

// The shape of the name, also in groups; null where there is none.
Shape* shapeNamed(const std::vector<std::unique_ptr<Shape>>& shapes, const std::string& name);

} // namespace settings
