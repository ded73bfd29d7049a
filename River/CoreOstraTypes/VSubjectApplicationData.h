#pragma once
// Display and application state of a subject. Corresponds by index with VSubject and
// VSubjectParametrised and must be rebuilt after any change to them.

#include "River/CoreOstraTypes/Colour.h"
#include "River/CoreOstraTypes/NameHash.h"

#include <cstdint>
#include <string>
#include <vector>

namespace CoreOstraTypes {

class VSubjectApplicationData {
public:
  struct VMarker {
    Colour m_Colour = DefaultColour;
    bool operator==(const VMarker&) const = default;
    static constexpr const char* FlowClassName = "MarkerApplicationData";
    template <class S, class V> static void FlowFields(S& s, V&& v) { v("Colour", "", s.m_Colour); }
  };

  struct VJoint {
    enum EEulerOrder : std::uint32_t {
      EXYZ = 0,
      EXZY = 1,
      EYXZ = 2,
      EYZX = 3,
      EZXY = 4,
      EZYX = 5,
      ENone = 6
    };
    EEulerOrder m_EulerOrder = EXYZ;
    std::string m_Labels; ///< labels of the state outputs, separated by blanks
    std::string m_Signs;  ///< one + or - per state output
    bool operator==(const VJoint&) const = default;
    static constexpr const char* FlowClassName = "JointApplicationData";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("EulerOrder", "", s.m_EulerOrder);
      v("Labels", "", s.m_Labels);
      v("Signs", "", s.m_Signs);
    }
  };

  struct VSegment {
    enum EDrawShading : std::uint32_t {
      EDrawShadingWireFrameUnlit = 0,
      EDrawShadingWireFrameLit = 1,
      EDrawShadingShadedFlat = 2,
      EDrawShadingShadedSmooth = 3
    };
    enum EDrawStyle : std::uint32_t {
      EDrawStyleTetrahedron = 0,
      EDrawStyleTetraStripe = 1,
      EDrawStyleBox = 2,
      EDrawStyleCarton = 3,
      EDrawStyleHead = 4,
      EDrawStyleSpine = 5,
      EDrawStyleCylinder = 6,
      EDrawStyleBodyPart = 7
    };
    Colour m_Colour = DefaultColour; ///< alpha is the opacity
    std::string m_Context;           ///< retargeting context, such as Left or Right
    double m_DrawEndRatio = 1.0;
    double m_DrawHeight = 0.5;
    EDrawShading m_DrawShading = EDrawShadingShadedSmooth;
    EDrawStyle m_DrawStyle = EDrawStyleBox;
    double m_DrawTwist = 0.0;
    double m_DrawWidth = 0.5;
    std::string m_Part; ///< body part for retargeting
    bool m_Visible = true;
    VJoint m_Joint;
    bool operator==(const VSegment&) const = default;
    static constexpr const char* FlowClassName = "SegmentApplicationData";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Colour", "", s.m_Colour);
      v("Context", "", s.m_Context);
      v("DrawEndRatio", "", s.m_DrawEndRatio);
      v("DrawHeight", "", s.m_DrawHeight);
      v("DrawShading", "", s.m_DrawShading);
      v("DrawStyle", "", s.m_DrawStyle);
      v("DrawTwist", "", s.m_DrawTwist);
      v("DrawWidth", "", s.m_DrawWidth);
      v("Part", "", s.m_Part);
      v("Visible", "", s.m_Visible);
      v("Joint", "", s.m_Joint);
    }
  };

  /// A line between two markers; indices into the subject's markers.
  struct VStick {
    std::uint32_t m_MarkerIndexA = 0;
    Colour m_ColourA = DefaultColour;
    std::uint32_t m_MarkerIndexB = 0;
    Colour m_ColourB = DefaultColour;
    bool operator==(const VStick&) const = default;
    static constexpr const char* FlowClassName = "Stick";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("MarkerIndexA", "", s.m_MarkerIndexA);
      v("ColourA", "", s.m_ColourA);
      v("MarkerIndexB", "", s.m_MarkerIndexB);
      v("ColourB", "", s.m_ColourB);
    }
  };

  struct VTarget {
    enum EDrawStyle : std::uint32_t {
      EDrawStyleNone = 0,
      EDrawStyleError = 1,
      EDrawStyleBoneLines = 2
    };
    Colour m_Colour = DefaultColour;
    EDrawStyle m_DrawStyle = EDrawStyleNone;
    bool m_FillGaps = false;
    std::string m_Name;
    bool m_Visible = true;
    bool operator==(const VTarget&) const = default;
    static constexpr const char* FlowClassName = "TargetApplicationData";
    template <class S, class V> static void FlowFields(S& s, V&& v) {
      v("Colour", "", s.m_Colour);
      v("DrawStyle", "", s.m_DrawStyle);
      v("FillGaps", "", s.m_FillGaps);
      v("Name", "", s.m_Name);
      v("Visible", "", s.m_Visible);
    }
  };

  std::uint32_t m_SubjectId = InvalidId;
  Colour m_Colour = DefaultColour;
  std::vector<VMarker> m_Markers;
  std::vector<VSegment> m_Segments;
  std::vector<VStick> m_Sticks;
  std::vector<VTarget> m_Targets;
  std::string m_Skin;
  Colour m_SkinColourA = DefaultColour;
  Colour m_SkinColourB = DefaultColour;
  std::string m_RetargetSourceTemplate;
  std::string m_RetargetSourceSubject;

  bool operator==(const VSubjectApplicationData&) const = default;
  static constexpr const char* FlowClassName = "SubjectApplicationData";
  template <class S, class V> static void FlowFields(S& s, V&& v) {
    v("SubjectId", "", s.m_SubjectId);
    v("Markers", "", s.m_Markers);
    v("Segments", "", s.m_Segments);
    v("Sticks", "", s.m_Sticks);
    v("Targets", "", s.m_Targets);
    v("Colour", "", s.m_Colour);
    v("Skin", "", s.m_Skin);
    v("SkinColourA", "", s.m_SkinColourA);
    v("SkinColourB", "", s.m_SkinColourB);
    v("RetargetSourceTemplate", "", s.m_RetargetSourceTemplate);
    v("RetargetSourceSubject", "", s.m_RetargetSourceSubject);
  }
};

} // namespace CoreOstraTypes
