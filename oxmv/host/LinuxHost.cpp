#include "oxmv/host/LinuxHost.h"

namespace oxmv {

Value LinuxHost::copyPreference(std::string_view, std::string_view) { return {}; }
void LinuxHost::setPreference(std::string_view, const Value&, std::string_view) {}
bool LinuxHost::synchronizePreferences(std::string_view, std::error_code*) { return true; }
std::string LinuxHost::localizedString(std::string_view, std::string_view builtIn) {
  return std::string(builtIn);
}
void LinuxHost::alert(std::string_view) {}
void LinuxHost::log(std::string_view) {}

}  // namespace oxmv
