// Base of the framework's signal classes.
#ifndef ZINRT_ZIN_SIGNALBASE_H
#define ZINRT_ZIN_SIGNALBASE_H

#include <cstdint>
#include <map>
#include <string>

#include "ZinRT/ZinCore_Export.h"

namespace ZinRT {

// Signals are always destroyed through their own class, so the destructor is deliberately not
// virtual; the warning about it is silenced for this class only.
#pragma GCC diagnostic push
#pragma GCC diagnostic ignored "-Wnon-virtual-dtor"
/// A named signal of a core with a type and string properties.
class ZINCORE_API Zin_SignalBase {
 public:
  /// Signal types of MOX cores.
  static const uint32_t SIGNAL_TYPE_MOX_ASYNC_INPUT;
  static const uint32_t SIGNAL_TYPE_MOX_SYNC_INPUT;
  static const uint32_t SIGNAL_TYPE_MOX_ASYNC_OUTPUT;
  static const uint32_t SIGNAL_TYPE_MOX_SYNC_OUTPUT;
  /// Flag added to the type of a signal group; clear it before comparing a group's type.
  static const uint32_t SIGNAL_TYPE_GROUP;

  Zin_SignalBase(uint32_t type, const std::string& name);
  Zin_SignalBase(const Zin_SignalBase&);
  Zin_SignalBase& operator=(const Zin_SignalBase&);
  // Not virtual: signals are always destroyed through their own class.
  ~Zin_SignalBase();

  /// The value of a property, or the empty text when it is not set.
  virtual std::string getProperty(const std::string& name) const;
  /// Sets a property; a null name is ignored, a null value sets the empty text.
  virtual void setProperty(const char* name, const char* value);
  virtual void setProperty(std::string& name, std::string& value);

  uint32_t getType() const { return type_; }
  const std::string& getName() const { return name_; }

 private:
  uint32_t type_;
  std::string name_;
  std::map<std::string, std::string> properties_;
};
#pragma GCC diagnostic pop

}  // namespace ZinRT

#endif
