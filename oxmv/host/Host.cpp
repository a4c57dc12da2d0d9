#include "oxmv/host/Host.h"

#include <mutex>
#include <utility>

#include "oxmv/host/LinuxHost.h"

namespace oxmv {
namespace {

std::mutex guard;

// Never destroyed: a host application may ask, or leave, while the process ends.
std::shared_ptr<Host>& installed() {
  static auto* const host = new std::shared_ptr<Host>;
  return *host;
}

const std::shared_ptr<Host>& defaultHost() {
  static const auto* const host = new std::shared_ptr<Host>(std::make_shared<LinuxHost>());
  return *host;
}

}  // namespace

Host::~Host() = default;

std::shared_ptr<Host> host() {
  const std::scoped_lock lock(guard);
  const std::shared_ptr<Host>& current = installed();
  return current != nullptr ? current : defaultHost();
}

std::shared_ptr<Host> installHost(std::shared_ptr<Host> host) {
  const std::scoped_lock lock(guard);
  return std::exchange(installed(), std::move(host));
}

}  // namespace oxmv
