#pragma once
#include <memory>
#include <string>
#include <vector>

namespace AnvilCore {

/// Reads one kind of input file into the scene (`g_db`). A new input format is one class
/// implementing this interface plus one `ANVIL_REGISTER_SCENE_READER` line in its .cpp.
class ISceneReader {
public:
  virtual ~ISceneReader() = default;
  /// Lower-case extensions without the dot, e.g. {"c3d"}.
  virtual std::vector<std::string> extensions() const = 0;
  /// A short description for `anvil formats`.
  virtual std::string description() const = 0;
  /// Adds the file's content to the scene. On failure returns false with one clear message in
  /// `o_rError` (naming what is wrong and where) and leaves the scene as it was.
  virtual bool read(const std::string& i_path, std::string& o_rError) = 0;
};

/// Reads a whole file as bytes. On failure returns false with "<path>: cannot open: <reason>" or
/// "<path>: read error" in `o_rError`.
bool readWholeFile(const std::string& i_path, std::string& o_rText, std::string& o_rError);

/// The readers known to the host, by extension.
class SceneReaderRegistry {
public:
  static SceneReaderRegistry& instance();
  void add(std::unique_ptr<ISceneReader> i_pReader);
  /// The reader of a path's extension (compared lower-case), or null.
  ISceneReader* find(const std::string& i_path) const;
  const std::vector<std::unique_ptr<ISceneReader>>& readers() const { return m_readers; }

private:
  std::vector<std::unique_ptr<ISceneReader>> m_readers;
};

template <typename T> struct SceneReaderRegistration {
  SceneReaderRegistration() { SceneReaderRegistry::instance().add(std::make_unique<T>()); }
};

} // namespace AnvilCore

#define ANVIL_REGISTER_SCENE_READER(Type)                                                          \
  static const ::AnvilCore::SceneReaderRegistration<Type> s_registration_##Type;
