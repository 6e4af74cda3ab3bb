#include "platform/system/Localization.h"

namespace qx {

String localizedText(std::string_view englishText) { return englishText; }

} // namespace qx
