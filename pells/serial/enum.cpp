#include "pells/serial/enum.h"

namespace pells {

BadEnum::~BadEnum() = default;

}  // namespace pells
