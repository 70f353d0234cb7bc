// The subcommands of dwxtree. Each returns the process exit code: 0 success,
// 1 the data had problems (reports, a path not found, a file that cannot be
// read or written), 2 a usage error.
#pragma once

#include "arguments.h"

namespace dwxtree {

constexpr int kExitOk = 0;
constexpr int kExitData = 1;
constexpr int kExitUsage = 2;

int RunShow(const Arguments& args);
int RunCheck(const Arguments& args);
int RunGet(const Arguments& args);
int RunMerge(const Arguments& args);
int RunJson(const Arguments& args);
int RunBase64(const Arguments& args);

}  // namespace dwxtree
