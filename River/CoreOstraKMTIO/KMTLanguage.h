#pragma once
// Constants of the subject file language shared by reader, writer and schema: versions, keyword
// tables, element names and joint sizes.

#include "River/CoreOstraTypes/SubjectEnums.h"
#include "River/CoreOstraTypes/VSubjectApplicationData.h"
#include "River/CoreOstraTypes/VSubjectParametrised.h"
#include "Utils/UtilsRapidXml/IEnum.h"
#include "Utils/UtilsRapidXml/IVersion.h"

#include <cstdint>
#include <string>

namespace CoreOstraKMTIO {

using UtilsRapidXml::IVersion;

namespace Versions {
inline constexpr IVersion None{};
inline constexpr IVersion V1_0{1, 0};
inline constexpr IVersion V1_5{1, 5};
inline constexpr IVersion V2_0{2, 0};
inline constexpr IVersion V2_1{2, 1};
inline constexpr IVersion V2_5{2, 5};
inline constexpr IVersion V2_6{2, 6};
inline constexpr IVersion V3_0{3, 0};
inline constexpr IVersion V3_1{3, 1};
inline constexpr IVersion V3_2{3, 2};
inline constexpr IVersion V3_3{3, 3};
inline constexpr IVersion V3_4{3, 4};
inline constexpr IVersion V3_5{3, 5};
} // namespace Versions

/// Oldest and newest versions a file may have.
inline constexpr IVersion MinVersion = Versions::V1_0;
inline constexpr IVersion MaxVersion = Versions::V3_5;

/// Version code that lets the writer choose the version from the subject's content.
inline constexpr int AutomaticVersionCode = 19;

/// The version of a writer version code (0 to 16); (-1, -1) for the codes without one.
IVersion VersionOfCode(int code);

/// Result codes of Read and Write.
inline constexpr std::uint32_t ResultOk = 0;
inline constexpr std::uint32_t ResultFailed = 0x80000020u;

/// Bit 27 of a marker status value: the marker is absent.
inline constexpr std::uint32_t MissingStatusBit = 0x08000000u;

using VJointType = CoreOstraTypes::VJointTypeBase::EJointType;
using VTargetType = CoreOstraTypes::VTargetTypeBase::ETargetType;
using VSegmentAppData = CoreOstraTypes::VSubjectApplicationData::VSegment;
using VJointAppData = CoreOstraTypes::VSubjectApplicationData::VJoint;
using VTargetAppData = CoreOstraTypes::VSubjectApplicationData::VTarget;
using VQuantity = CoreOstraTypes::VSubjectParametrised::VStaticParameter::EQuantity;

const UtilsRapidXml::VEnum<VSegmentAppData::EDrawStyle>& DrawStyleEnum();
const UtilsRapidXml::VEnum<VSegmentAppData::EDrawShading>& DrawShadingEnum();
const UtilsRapidXml::VEnum<VJointAppData::EEulerOrder>& EulerOrderEnum();
const UtilsRapidXml::VEnum<VQuantity>& QuantityEnum();
/// Marker status values: the status with the Missing bit.
const UtilsRapidXml::VEnum<std::uint32_t>& StatusEnum();
const UtilsRapidXml::VEnum<VTargetAppData::EDrawStyle>& TargetDrawStyleEnum();

/// Element of a joint type ("JointBall" ...); empty for an invalid type.
std::string JointElementName(VJointType type);
/// Element of a target type (both Gaussian and plain kinds share one); empty when invalid.
std::string TargetElementName(VTargetType type);

/// Size of a target kind's state before any rigid body markers.
std::size_t TargetStateSize(VTargetType type);

} // namespace CoreOstraKMTIO
