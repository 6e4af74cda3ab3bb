#include "Settings.h"

#include <cmath>
#include <numbers>

namespace settings {

double Circle::area() const { return std::numbers::pi * radius * radius; }

void Circle::scale(double factor) { radius *= factor; }

double Rectangle::area() const {
    const double edge = corner.value_or(0);
    return width * height - (4 - std::numbers::pi) * edge * edge;
}

void Rectangle::scale(double factor) {
    width *= factor;
    height *= factor;
    if (corner)
        *corner *= factor;
}

double Path::area() const {
    double twice = 0;
    for (std::size_t i = 0; i < points.size(); ++i) {
        const Point& a = points[i];
        const Point& b = points[(i + 1) % points.size()];
        twice += a.x * b.y - b.x * a.y;
    }
    return std::abs(twice) / 2;
}

void Path::scale(double factor) {
    for (Point& point : points) {
        point.x *= factor;
        point.y *= factor;
    }
}

double Group::area() const {
    double sum = 0;
    for (const auto& shape : shapes)
        sum += shape->area();
    return sum;
}

void Group::scale(double factor) {
    for (const auto& shape : shapes)
        shape->scale(factor);
}

void describeClasses() {
    qx::Class::define<Plain>("Plain").members<&Plain::colour, &Plain::unknown>();
    qx::Class::define<Gradient>("Gradient")
        .members<&Gradient::from, &Gradient::to, &Gradient::unknown>();
    qx::Class::define<Shape>("Shape").members<&Shape::name, &Shape::fill, &Shape::unknown>();
    qx::Class::define<Circle, Shape>("Circle").members<&Circle::radius>();
    qx::Class::define<Rectangle, Shape>("Rectangle")
        .members<&Rectangle::width, &Rectangle::height, &Rectangle::corner>();
    qx::Class::define<Point>("Point").members<&Point::x, &Point::y, &Point::unknown>();
    qx::Class::define<Path, Shape>("Path").members<&Path::points>();
    qx::Class::define<Group, Shape>("Group").members<&Group::shapes>();
    qx::Class::define<Settings>("Settings")
        .members<&Settings::grid, &Settings::palette, &Settings::unknown>();
}

Shape* shapeNamed(const std::vector<std::unique_ptr<Shape>>& shapes, const std::string& name) {
    for (const auto& shape : shapes) {
        if (shape->name == name)
            return shape.get();
        if (const auto* group = dynamic_cast<const Group*>(shape.get()))
            if (Shape* inside = shapeNamed(group->shapes, name))
                return inside;
    }
    return nullptr;
}

} // namespace settings
