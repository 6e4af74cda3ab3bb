#include "Item.h"

#include <charconv>

std::string Money::text() const {
    std::string digits = std::to_string(cents < 0 ? -cents : cents);
    if (digits.size() < 3)
        digits.insert(0, 3 - digits.size(), '0');
    const std::size_t whole = digits.size() - 2;
    return (cents < 0 ? "-" : "") + digits.substr(0, whole) + '.' + digits.substr(whole);
}

bool Money::parse(std::string_view text, Money& result) {
    const std::size_t point = text.find('.');
    if (point == std::string_view::npos || text.size() - point != 3)
        return false;
    std::string digits(text);
    digits.erase(point, 1);
    std::int64_t cents = 0;
    const char* end = digits.data() + digits.size();
    const auto [stop, problem] = std::from_chars(digits.data(), end, cents);
    if (problem != std::errc() || stop != end)
        return false;
    result.cents = cents;
    return true;
}

void registerItem() {
    qx::Class::define<Item>("Item")
        .property<&Item::article>("article")
        .property<&Item::name>("name")
        .property<&Item::quantity>("quantity")
        .property<&Item::gift>("gift")
        .property<&Item::price>("price")
        .property<&Item::unboundChildren>("unboundChildren")
        .property<&Item::unboundAttributes>("unboundAttributes")
        .property<&Item::namespaces>("__namespaces")
        .operation<&Item::isRemovable>("isRemovable");
}
