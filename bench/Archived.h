#pragma once

// The orders for libraries that write and read documents of their own form.

#include "Orders.h"

namespace bench {

// About as many orders as a document of that many megabytes has.
inline Orders ordersToArchive(std::size_t megabytes) {
    Orders orders;
    for (std::size_t i = 0; i < megabytes * 1100; ++i) {
        const std::string number = std::to_string(i);
        Order order;
        order.number = "A-" + number;
        order.date = "2026-03-" + std::to_string(10 + i % 18);
        order.remark = "Leave at the door";
        order.shipTo = {"Customer " + number, "High Street " + std::to_string(i % 97),
                        "Town & Country", "DE"};
        for (std::size_t line = 0; line < 3 + i % 5; ++line)
            order.lines.push_back(
                {static_cast<int>(1 + line), std::to_string(100000 + (i * 7 + line) % 9999),
                 "Article " + std::to_string(line), 5.95 + static_cast<double>(line)});
        orders.orders.push_back(std::move(order));
    }
    return orders;
}

} // namespace bench
