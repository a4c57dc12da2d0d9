// The one door to the application that the library is loaded into.

#pragma once

#include <memory>
#include <string>
#include <string_view>
#include <system_error>

#include "oxmv/values/Value.h"

namespace oxmv {

// What the library asks of its host: a preference, a localised string, an alert, a log line.
// Nothing else of the environment is looked at, and nothing is printed. An application that keeps
// preferences or talks to its users in a way of its own installs a host of its own; every other
// gets the default, LinuxHost.
//
// The library calls from whichever thread called it, so a host that is used from several threads
// must be able to answer them. No answer may be an exception but std::bad_alloc.
class Host {
 public:
  Host() = default;
  Host(const Host&) = delete;
  Host& operator=(const Host&) = delete;
  virtual ~Host();

  // The preference kept under the key for an application, of whatever kind it is: hosts do not
  // convert. Nothing when there is none. Asked afresh for every path that is made.
  virtual Value copyPreference(std::string_view key, std::string_view appID) = 0;

  // Changes a preference for the current user, on any machine; the value nothing removes it. From
  // here on copyPreference() answers the new value, in this process. Others see it after
  // synchronizePreferences().
  virtual void setPreference(std::string_view key, const Value& value, std::string_view appID) = 0;

  // Brings what was set to where it is kept. Answers false, with the cause in `error` unless that
  // is null, when that fails; then what was kept is kept still, whole.
  virtual bool synchronizePreferences(std::string_view appID, std::error_code* error = nullptr) = 0;

  // The host's own text for the key, in the language of its user; `builtIn` when it has none. Path
  // templates come this way, too.
  virtual std::string localizedString(std::string_view key, std::string_view builtIn) = 0;

  // Tells the user something that needs attention, and comes back when that is done. The title is
  // the platform's own, and there is one button.
  virtual void alert(std::string_view message) = 0;

  // One line, without its end, for the system's log.
  virtual void log(std::string_view line) = 0;
};

// The host in use: the one last installed, or the default. Never null. Hold what is returned for as
// long as it is used: another thread may install another host meanwhile.
std::shared_ptr<Host> host();

// Puts a host in use, for the whole process; null puts the default back. Answers the one that was
// installed before, null if that was the default.
std::shared_ptr<Host> installHost(std::shared_ptr<Host> host);

}  // namespace oxmv
