#pragma once
#include "HString.h"
#include "HostExport.h"
#include <map>
#include <string>

/// The host's user setup store: values by section and key, kept between runs in an INI file.
/// The last argument of every call is a scope, always `HString::EMPTY_STRING` from exporters.
class ANVIL_HOST_API HInterface {
public:
  bool getUserSetupBool(const HString& i_section, const HString& i_key, bool i_default,
                        const HString& i_scope) const;
  double getUserSetupDouble(const HString& i_section, const HString& i_key, double i_default,
                            const HString& i_scope) const;
  int getUserSetupInt(const HString& i_section, const HString& i_key, int i_default,
                      const HString& i_scope) const;
  HString getUserSetupString(const HString& i_section, const HString& i_key, const char* i_pDefault,
                             const HString& i_scope) const;
  void setUserSetupBool(const HString& i_section, const HString& i_key, bool i_value,
                        const HString& i_scope);
  void setUserSetupDouble(const HString& i_section, const HString& i_key, double i_value,
                          const HString& i_scope);
  void setUserSetupInt(const HString& i_section, const HString& i_key, int i_value,
                       const HString& i_scope);
  void setUserSetupString(const HString& i_section, const HString& i_key, const HString& i_value,
                          const HString& i_scope);

  /// Host side. Reads the store from an INI file; a missing file gives an empty store.
  /// Returns false with `o_rError` set when the file exists but cannot be read or parsed.
  bool load(const std::string& i_path, std::string& o_rError);
  /// Writes the store back to the file it was loaded from (creating folders), atomically.
  bool save(std::string& o_rError) const;
  const std::string& getPath() const { return m_path; }
  void clear() { m_values.clear(); }
  /// Raw text of a key, or null.
  const std::string* find(const std::string& i_section, const std::string& i_key) const;
  /// The default location: $XDG_CONFIG_HOME/anvil/usersetup.ini, else ~/.config/anvil/...
  static std::string defaultPath();

private:
  void set(const HString& i_section, const HString& i_key, std::string i_value);

  std::string m_path;
  std::map<std::string, std::map<std::string, std::string>> m_values;
};

extern ANVIL_HOST_API HInterface g_interface;
