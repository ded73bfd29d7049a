#pragma once
#include "Node.h"

/// A light of the scene: a node that shines along its local -Z. Exporters that know no light
/// carry it as a transform.
class ANVIL_HOST_API Light : public Node {
  H_DECLARE_RUNTIME_CLASS(Light)
public:
  explicit Light(const HString& i_rName = HString());

  /// Colour, each component 0 to 1.
  const Vec3& getColor() const { return m_color; }
  void setColor(const Vec3& i_rColor) { m_color = i_rColor; }
  /// Intensity relative to the host's unit light.
  double getIntensity() const { return m_intensity; }
  void setIntensity(double i_intensity) { m_intensity = i_intensity; }

private:
  Vec3 m_color{1.0, 1.0, 1.0};
  double m_intensity = 1.0;
};
