#pragma once

// What was inferred, as text.

#include "qxxml/infer/Inference.h"

namespace qxxml {

// A mapping document with comments that tell how often everything was seen.
std::string mappingText(const std::vector<InferredClass>& classes, std::size_t documentCount);

// Structs and their descriptions for that mapping, those first that others hold by value. A class
// that would hold itself by value is held in a std::unique_ptr.
std::string structsText(const std::vector<InferredClass>& classes, std::size_t documentCount);

} // namespace qxxml
