#include "pells/serial/simple_type_handler.h"

namespace pells {

template class TextTypeHandler<std::string>;
template class TextTypeHandler<float>;
template class TextTypeHandler<bool>;
template class SimpleTypeHandler<std::string>;
template class SimpleTypeHandler<float>;
template class SimpleTypeHandler<bool>;

}  // namespace pells
