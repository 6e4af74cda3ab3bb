// The orders as Boost.Serialization's XML archive: a document of its own form, told in passes over
// that.

#include "Archived.h"
#include "Beside.h"

#include <boost/archive/xml_iarchive.hpp>
#include <boost/archive/xml_oarchive.hpp>
#include <boost/serialization/nvp.hpp>
#include <boost/serialization/string.hpp>
#include <boost/serialization/vector.hpp>

#include <sstream>

namespace boost::serialization {

template <class Archive>
void serialize(Archive& archive, bench::Line& line, unsigned) {
    archive& make_nvp("quantity", line.quantity) & make_nvp("article", line.article) &
        make_nvp("title", line.title) & make_nvp("price", line.price);
}
template <class Archive>
void serialize(Archive& archive, bench::Address& address, unsigned) {
    archive& make_nvp("name", address.name) & make_nvp("street", address.street) &
        make_nvp("city", address.city) & make_nvp("country", address.country);
}
template <class Archive>
void serialize(Archive& archive, bench::Order& order, unsigned) {
    archive& make_nvp("number", order.number) & make_nvp("date", order.date) &
        make_nvp("remark", order.remark) & make_nvp("shipTo", order.shipTo) &
        make_nvp("lines", order.lines);
}
template <class Archive>
void serialize(Archive& archive, bench::Orders& orders, unsigned) {
    archive& make_nvp("orders", orders.orders);
}

} // namespace boost::serialization

namespace {

std::string archived(const bench::Orders& orders) {
    std::ostringstream stream;
    {
        boost::archive::xml_oarchive archive(stream);
        archive << boost::serialization::make_nvp("orders", orders);
    }
    return stream.str();
}

void boostRead(benchmark::State& state) {
    const bench::Orders written = bench::ordersToArchive(10);
    const std::string xml = archived(written);
    bench::besideUnit(state, xml, [&] {
        std::istringstream stream(xml);
        boost::archive::xml_iarchive archive(stream);
        bench::Orders orders;
        archive >> boost::serialization::make_nvp("orders", orders);
        return orders.orders.size() == written.orders.size();
    });
    state.counters["textMB"] = static_cast<double>(xml.size()) / 1e6;
}
void boostWrite(benchmark::State& state) {
    const bench::Orders orders = bench::ordersToArchive(10);
    const std::string xml = archived(orders);
    bench::besideUnit(state, xml, [&] { return archived(orders).size() == xml.size(); });
}

BENCHMARK(boostRead)->Iterations(3)->Unit(benchmark::kMillisecond)->UseManualTime();
BENCHMARK(boostWrite)->Iterations(3)->Unit(benchmark::kMillisecond)->UseManualTime();

} // namespace
