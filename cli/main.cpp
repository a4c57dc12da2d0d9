#include <cstddef>

#include "cli/Run.h"

int main(int argc, char** argv) { return oxmv::cli::run({argv, static_cast<std::size_t>(argc)}); }
