#include "OstraAlgo/KinematicAlgo/VSubjectSetCalibrated.h"

#include "OstraAlgo/KinematicAlgo/CalibratedText.h"

#include <istream>
#include <iterator>
#include <ostream>

namespace KinematicAlgo {

void VSubjectSetCalibrated::Add(std::shared_ptr<ISubjectCalibrated> subject) {
  if (subject) m_Subjects.push_back(std::move(subject));
}

bool VSubjectSetCalibrated::Remove(std::uint32_t index) {
  if (index >= m_Subjects.size()) return false;
  m_Subjects.erase(m_Subjects.begin() + index);
  return true;
}

std::shared_ptr<ISubjectCalibrated> VSubjectSetCalibrated::Get(std::uint32_t index) const {
  return index < m_Subjects.size() ? m_Subjects[index] : nullptr;
}

bool VSubjectSetCalibrated::Equals(const ISubjectSetCalibrated& other) const {
  if (other.Count() != Count()) return false;
  for (std::uint32_t i = 0; i < Count(); ++i)
    if (!m_Subjects[i]->Equals(*other.Get(i))) return false;
  return true;
}

void VSubjectSetCalibrated::Write(std::ostream& o) const {
  o << "NumSubjects: " << m_Subjects.size() << '\n';
  for (const auto& subject : m_Subjects)
    subject->Write(o);
}

bool VSubjectSetCalibrated::Read(std::istream& io_rStream, std::string* o_pError) {
  const std::string text{std::istreambuf_iterator<char>(io_rStream),
                         std::istreambuf_iterator<char>()};
  if (io_rStream.bad()) {
    if (o_pError) *o_pError = "the stream failed while reading";
    return false;
  }
  return ReadText(text, o_pError);
}

bool VSubjectSetCalibrated::ReadText(std::string_view text, std::string* o_pError) {
  VTextReader r(text);
  std::vector<std::shared_ptr<ISubjectCalibrated>> subjects;
  std::uint32_t count = 0;
  bool ok =
      r.Label("NumSubjects: ") &&
      r.Count(count, std::uint32_t(std::min<size_t>(r.Remaining(), UINT32_MAX)), "NumSubjects");
  for (std::uint32_t i = 0; ok && i < count; ++i) {
    auto subject = std::make_shared<VSubjectCalibrated>();
    ok = subject->ReadFrom(r);
    subjects.push_back(subject);
  }
  ok = ok && (r.AtEnd() || r.Fail("unexpected text after the subjects"));
  if (!ok) {
    if (o_pError) *o_pError = r.Error();
    return false;
  }
  m_Subjects = std::move(subjects);
  return true;
}

} // namespace KinematicAlgo
