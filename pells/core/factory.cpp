#include "pells/core/factory.h"

namespace pells {

template class NamedObject<FactoryByName, FactoryByName*>;
template class NamedObject<FactoryByTypeID, FactoryByTypeID*>;

FactoryByName::FactoryByName(const std::string& className)
    : NamedObject<FactoryByName, FactoryByName*>(className) {}

FactoryByName::~FactoryByName() = default;

FactoryByTypeID::FactoryByTypeID(const std::string& typeName)
    : NamedObject<FactoryByTypeID, FactoryByTypeID*>(typeName) {}

FactoryByTypeID::~FactoryByTypeID() = default;

}  // namespace pells
