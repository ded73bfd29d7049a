#pragma once
#include "XcpCameraRecord.h"
#include <cstdint>
#include <memory>
#include <string>

namespace rapidxml {
template <class Ch> class xml_document;
template <class Ch> class xml_node;
template <class Ch> class xml_attribute;
} // namespace rapidxml

/// Builds a camera calibration document in memory: a `Cameras` root whose attributes are
/// VERSION, SOURCE, UP_AXIS and FLOOR_EXTENTS, then one `Camera` element per added record.
/// VERSION is "1.0" until a camera with a distortion model other than the two-parameter one is
/// added, and "2.0" from then on. Doubles are written with "%.17g".
class XcpWriter {
public:
  /// With `i_runningUserIds` each camera's USERID is its count from 1 instead of its record's.
  explicit XcpWriter(bool i_runningUserIds);
  ~XcpWriter();
  XcpWriter(const XcpWriter&) = delete;
  XcpWriter& operator=(const XcpWriter&) = delete;

  void setSource(const std::string& i_rSource);
  /// "Y" or "Z".
  void setUpAxis(const std::string& i_rAxis);
  /// The floor's extents in millimetres.
  void setFloorExtents(std::int32_t i_minX, std::int32_t i_maxX, std::int32_t i_minYZ,
                       std::int32_t i_maxYZ);
  /// Appends one camera with its calibration as the key frame of `i_frame`.
  void addCamera(const XcpCameraRecord& i_rCamera, int i_frame);

  /// The document as text, with its XML declaration, printed with the library's default format.
  std::string toString() const;
  /// Writes the document to a file; false when the file cannot be opened or written.
  bool save(const std::string& i_rPath) const;

private:
  using Document = rapidxml::xml_document<char>;
  using Element = rapidxml::xml_node<char>;
  Element* appendElement(Element* i_pParent, const char* i_pName);
  void setAttribute(Element* i_pElement, const char* i_pName, const std::string& i_rValue);
  void addDetail(Element* i_pCamera, Element* i_pBefore, const char* i_pName,
                 const CoreOstraTypes::VCameraCalibrationDetail& i_rDetail);
  void addKeyFrame(Element* i_pKeyFrames, const CoreOstraTypes::VCameraCalibration& i_rCalibration,
                   int i_frame);

  std::unique_ptr<Document> m_pDocumentInfo;
  Element* m_pRoot = nullptr;
  bool m_runningUserIds;
  int m_cameraCount = 0;
};
