#pragma once
// A list of calibrated subjects, written and read as one text.

#include "OstraAlgo/KinematicAlgo/VCalibrated.h"

#include <iosfwd>

namespace KinematicAlgo {

class ISubjectSetCalibrated {
public:
  virtual ~ISubjectSetCalibrated() = default;
  virtual void Add(std::shared_ptr<ISubjectCalibrated> subject) = 0;
  /// False for an index out of range.
  virtual bool Remove(std::uint32_t index) = 0;
  virtual std::uint32_t Count() const = 0;
  virtual std::shared_ptr<ISubjectCalibrated> Get(std::uint32_t index) const = 0;
  virtual void Clear() = 0;
  /// Same count and each subject equal, in order.
  virtual bool Equals(const ISubjectSetCalibrated& other) const = 0;
  /// "NumSubjects: " and the count, then each subject's text.
  virtual void Write(std::ostream& o_rStream) const = 0;
  /// Reads a set written by Write from the rest of the stream; on failure the set is unchanged
  /// and `o_pError` says what and where.
  virtual bool Read(std::istream& io_rStream, std::string* o_pError = nullptr) = 0;
};

class VSubjectSetCalibrated : public ISubjectSetCalibrated {
public:
  void Add(std::shared_ptr<ISubjectCalibrated> subject) override;
  bool Remove(std::uint32_t index) override;
  std::uint32_t Count() const override { return std::uint32_t(m_Subjects.size()); }
  std::shared_ptr<ISubjectCalibrated> Get(std::uint32_t index) const override;
  void Clear() override { m_Subjects.clear(); }
  bool Equals(const ISubjectSetCalibrated& other) const override;
  void Write(std::ostream& o_rStream) const override;
  bool Read(std::istream& io_rStream, std::string* o_pError = nullptr) override;
  bool ReadText(std::string_view text, std::string* o_pError = nullptr);

private:
  std::vector<std::shared_ptr<ISubjectCalibrated>> m_Subjects;
};

} // namespace KinematicAlgo
