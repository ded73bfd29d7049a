#include "plugin/host/HCamera.h"
#include "plugin/host/OpticalCamera.h"
#include "plugin/host/VideoCamera.h"

H_IMPLEMENT_RUNTIME_CLASS(HCamera, Node)
H_IMPLEMENT_RUNTIME_CLASS(OpticalCamera, HCamera)
H_IMPLEMENT_RUNTIME_CLASS(VideoCamera, HCamera)

HCamera::HCamera(const HString& i_rName) : Node(i_rName) {}

VideoCamera::VideoCamera(const HString& i_rName) : HCamera(i_rName) {}
