#include "xml/ParseFailure.h"

namespace qx {

namespace {

constexpr ErrorText parsersText{0, "%@", parseErrors::notWellFormed};
constexpr ErrorText noText{0, parseErrors::notWellFormed, parseErrors::notWellFormed};

} // namespace

ParseFailure::ParseFailure(const ErrorText& ours, std::vector<Value> filledIn, std::size_t at)
    : code(ours.code), text(&ours), arguments(std::move(filledIn)), offset(at) {}

ParseFailure::ParseFailure(int parsersCode, std::string_view parsersMessage, std::size_t at)
    : code(parsersCode),
      text(parsersMessage.empty() ? &noText : &parsersText), arguments{parsersMessage}, offset(at) {
}

} // namespace qx
