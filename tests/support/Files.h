// Files as tests make and look at them.

#pragma once

#include <filesystem>
#include <set>
#include <string>

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "tests/support/StreamBuilder.h"

namespace oxmv::test {

void putFile(const std::filesystem::path& path, const Bytes& content);

// No bytes when there is no such file.
Bytes getFile(const std::filesystem::path& path);

// What is in a folder.
std::set<std::string> namesIn(const std::filesystem::path& folder);

// Runs `body` in a process of its own, as a user who may not do everything; answers whether it
// returned true.
template <class Body>
bool asOrdinaryUser(Body body) {
  const pid_t child = ::fork();
  if (child == 0) {
    const bool isOrdinary = ::geteuid() != 0 || (::setegid(65534) == 0 && ::seteuid(65534) == 0);
    ::_exit(isOrdinary && body() ? 0 : 1);
  }
  int status = 1;
  EXPECT_EQ(::waitpid(child, &status, 0), child);
  return WIFEXITED(status) && WEXITSTATUS(status) == 0;
}

}  // namespace oxmv::test
