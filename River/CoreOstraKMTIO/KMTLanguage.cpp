#include "River/CoreOstraKMTIO/KMTLanguage.h"

namespace CoreOstraKMTIO {

using UtilsRapidXml::VEnum;

IVersion VersionOfCode(int code) {
  switch (code) {
  case 0:
    return {1, 0};
  case 1:
    return {1, 5};
  case 3:
    return {2, 0};
  case 4:
    return {2, 1};
  case 5:
    return {2, 2};
  case 6:
    return {2, 3};
  case 7:
    return {2, 4};
  case 8:
    return {2, 5};
  case 9:
    return {2, 6};
  case 11:
    return {3, 0};
  case 12:
    return {3, 1};
  case 13:
    return {3, 2};
  case 14:
    return {3, 3};
  case 15:
    return {3, 4};
  case 16:
    return {3, 5};
  default:
    return {};
  }
}

const VEnum<VSegmentAppData::EDrawStyle>& DrawStyleEnum() {
  static const VEnum<VSegmentAppData::EDrawStyle> e(
      "TYPE_DRAW-STYLE", {{"tetrahedron", VSegmentAppData::EDrawStyleTetrahedron},
                          {"tetra-stripe", VSegmentAppData::EDrawStyleTetraStripe},
                          {"box", VSegmentAppData::EDrawStyleBox},
                          {"carton", VSegmentAppData::EDrawStyleCarton},
                          {"head", VSegmentAppData::EDrawStyleHead},
                          {"spine", VSegmentAppData::EDrawStyleSpine},
                          {"cylinder", VSegmentAppData::EDrawStyleCylinder},
                          {"bodypart", VSegmentAppData::EDrawStyleBodyPart}});
  return e;
}

const VEnum<VSegmentAppData::EDrawShading>& DrawShadingEnum() {
  static const VEnum<VSegmentAppData::EDrawShading> e(
      "TYPE_DRAW-SHADING", {{"wireframe-unlit", VSegmentAppData::EDrawShadingWireFrameUnlit},
                            {"wireframe-lit", VSegmentAppData::EDrawShadingWireFrameLit},
                            {"shaded-flat", VSegmentAppData::EDrawShadingShadedFlat},
                            {"shaded-smooth", VSegmentAppData::EDrawShadingShadedSmooth}});
  return e;
}

const VEnum<VJointAppData::EEulerOrder>& EulerOrderEnum() {
  static const VEnum<VJointAppData::EEulerOrder> e("TYPE_EULER-ORDER",
                                                   {{"XYZ", VJointAppData::EXYZ},
                                                    {"XZY", VJointAppData::EXZY},
                                                    {"YXZ", VJointAppData::EYXZ},
                                                    {"YZX", VJointAppData::EYZX},
                                                    {"ZXY", VJointAppData::EZXY},
                                                    {"ZYX", VJointAppData::EZYX}});
  return e;
}

const VEnum<VQuantity>& QuantityEnum() {
  using P = CoreOstraTypes::VSubjectParametrised::VStaticParameter;
  static const VEnum<VQuantity> e("TYPE_QUANTITY", {{"scalar", P::EQuantityScalar},
                                                    {"length", P::EQuantityLength},
                                                    {"angle", P::EQuantityAngle},
                                                    {"mass", P::EQuantityMass},
                                                    {"time", P::EQuantityTime}});
  return e;
}

const VEnum<std::uint32_t>& StatusEnum() {
  static const VEnum<std::uint32_t> e("TYPE_STATUS", {{"required", 0u},
                                                      {"optional", 1u},
                                                      {"constraint", 2u},
                                                      {"virtual-constraint", 3u},
                                                      {"missing", 0x8000001u},
                                                      {"missing-constraint", 0x8000002u}});
  return e;
}

const VEnum<VTargetAppData::EDrawStyle>& TargetDrawStyleEnum() {
  static const VEnum<VTargetAppData::EDrawStyle> e(
      "TYPE_TARGET-DRAW-STYLE", {{"None", VTargetAppData::EDrawStyleNone},
                                 {"Error", VTargetAppData::EDrawStyleError},
                                 {"BoneLines", VTargetAppData::EDrawStyleBoneLines}});
  return e;
}

std::string JointElementName(VJointType type) {
  using J = CoreOstraTypes::VJointTypeBase;
  switch (type) {
  case J::EBall:
    return "JointBall";
  case J::EDummy:
    return "JointDummy";
  case J::EFree:
    return "JointFree";
  case J::EHardySpicer:
    return "JointHardySpicer";
  case J::EHinge:
    return "JointHinge";
  case J::ESlider:
    return "JointSlider";
  default:
    return {};
  }
}

std::string TargetElementName(VTargetType type) {
  using T = CoreOstraTypes::VTargetTypeBase;
  switch (type) {
  case T::ELocalLineToWorldPoint:
  case T::ELocalLineToWorldPointGaussian:
    return "TargetLocalLineToWorldPoint";
  case T::ELocalPlaneToWorldPoint:
  case T::ELocalPlaneToWorldPointGaussian:
    return "TargetLocalPlaneToWorldPoint";
  case T::ELocalPointToWorldPoint:
  case T::ELocalPointToWorldPointGaussian:
    return "TargetLocalPointToWorldPoint";
  case T::ERigidBody:
    return "TargetRigidBody";
  case T::ELocalRotationToWorldRotation:
    return "TargetLocalRotationToWorldRotation";
  case T::ELocalDirectionToWorldDirection:
    return "TargetLocalDirectionToWorldDirection";
  default:
    return {};
  }
}

std::size_t TargetStateSize(VTargetType type) {
  using T = CoreOstraTypes::VTargetTypeBase;
  switch (type) {
  case T::ELocalLineToWorldPoint:
  case T::ELocalLineToWorldPointGaussian:
  case T::ELocalPlaneToWorldPoint:
  case T::ELocalPlaneToWorldPointGaussian:
  case T::ERigidBody:
    return 6;
  default:
    return 3;
  }
}

} // namespace CoreOstraKMTIO
