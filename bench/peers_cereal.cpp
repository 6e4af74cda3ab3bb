// The orders as cereal's XML archive: a document of its own form, told in passes over that.

#include "Archived.h"
#include "Beside.h"

#include <cereal/archives/xml.hpp>
#include <cereal/types/string.hpp>
#include <cereal/types/vector.hpp>

#include <sstream>

namespace bench {

template <class Archive>
void serialize(Archive& archive, Line& line) {
    archive(cereal::make_nvp("quantity", line.quantity), cereal::make_nvp("article", line.article),
            cereal::make_nvp("title", line.title), cereal::make_nvp("price", line.price));
}
template <class Archive>
void serialize(Archive& archive, Address& address) {
    archive(cereal::make_nvp("name", address.name), cereal::make_nvp("street", address.street),
            cereal::make_nvp("city", address.city), cereal::make_nvp("country", address.country));
}
template <class Archive>
void serialize(Archive& archive, Order& order) {
    archive(cereal::make_nvp("number", order.number), cereal::make_nvp("date", order.date),
            cereal::make_nvp("remark", order.remark), cereal::make_nvp("shipTo", order.shipTo),
            cereal::make_nvp("lines", order.lines));
}
template <class Archive>
void serialize(Archive& archive, Orders& orders) {
    archive(cereal::make_nvp("orders", orders.orders));
}

} // namespace bench

namespace {

std::string archived(const bench::Orders& orders) {
    std::ostringstream stream;
    {
        cereal::XMLOutputArchive archive(stream);
        archive(cereal::make_nvp("orders", orders));
    }
    return stream.str();
}

void cerealRead(benchmark::State& state) {
    const bench::Orders written = bench::ordersToArchive(10);
    const std::string xml = archived(written);
    bench::besideUnit(state, xml, [&] {
        std::istringstream stream(xml);
        cereal::XMLInputArchive archive(stream);
        bench::Orders orders;
        archive(cereal::make_nvp("orders", orders));
        return orders.orders.size() == written.orders.size();
    });
    state.counters["textMB"] = static_cast<double>(xml.size()) / 1e6;
}
void cerealWrite(benchmark::State& state) {
    const bench::Orders orders = bench::ordersToArchive(10);
    const std::string xml = archived(orders);
    bench::besideUnit(state, xml, [&] { return archived(orders).size() == xml.size(); });
}

BENCHMARK(cerealRead)->Iterations(3)->Unit(benchmark::kMillisecond)->UseManualTime();
BENCHMARK(cerealWrite)->Iterations(3)->Unit(benchmark::kMillisecond)->UseManualTime();

} // namespace
