#include "plugin/host/Light.h"

H_IMPLEMENT_RUNTIME_CLASS(Light, Node)

Light::Light(const HString& i_rName) : Node(i_rName) {}
