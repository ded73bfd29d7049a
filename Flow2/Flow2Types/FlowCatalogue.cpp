#include "Flow2/Flow2Types/FlowCatalogue.h"

#include <memory>

namespace ZMT {

IFlowItemFactories GetFlowCatalogueFactories() {
  IFlowItemFactories factories;
#define ANVIL_FLOW_ADD_FACTORY(Wrapper, ...)                                                       \
  factories.push_back(std::make_shared<Detail::VFlowItemFactory<Catalogue::Wrapper>>());
  ANVIL_FLOW_CATALOGUE(ANVIL_FLOW_ADD_FACTORY)
#undef ANVIL_FLOW_ADD_FACTORY
  return factories;
}

} // namespace ZMT
