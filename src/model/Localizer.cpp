#include "model/Localizer.h"

#include <atomic>

namespace qx {

namespace {

std::atomic<Localizer> installed{nullptr};

} // namespace

void installLocalizer(Localizer localizer) noexcept { installed.store(localizer); }

String localizedText(std::string_view englishText) {
    const Localizer localizer = installed.load();
    return localizer != nullptr ? localizer(englishText) : String(englishText);
}

} // namespace qx
