#pragma once
#include "HCamera.h"

/// A reference video camera: a node with the video file it recorded.
class ANVIL_HOST_API VideoCamera : public HCamera {
  H_DECLARE_RUNTIME_CLASS(VideoCamera)
public:
  explicit VideoCamera(const HString& i_rName = HString());

  /// Path of the recorded video as the scene gives it; empty when there is none.
  const HString& getVideoFile() const { return m_videoFile; }
  void setVideoFile(const HString& i_rPath) { m_videoFile = i_rPath; }

private:
  HString m_videoFile;
};
