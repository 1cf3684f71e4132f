#pragma once

#include <time.h>
#include <unistd.h>

#include <fstream>
#include <sstream>
#include <string>
#include <string_view>

// CPU time and memory, of this process and thread or of another process by its /proc entries.
namespace cputime {

inline double secondsOf(clockid_t clock) {
  timespec time{};
  clock_gettime(clock, &time);
  return static_cast<double>(time.tv_sec) + static_cast<double>(time.tv_nsec) * 1e-9;
}

inline double threadCpuSeconds() {
  return secondsOf(CLOCK_THREAD_CPUTIME_ID);
}
inline double processCpuSeconds() {
  return secondsOf(CLOCK_PROCESS_CPUTIME_ID);
}

// User and system CPU time of another process, in seconds.
inline double cpuSecondsOf(pid_t pid) {
  std::ifstream stat("/proc/" + std::to_string(pid) + "/stat");
  std::string line;
  std::getline(stat, line);
  // The fields after the command's name, which is in parentheses and may hold spaces.
  std::istringstream fields(line.substr(line.rfind(')') + 2));
  std::string field;
  unsigned long long user = 0, system = 0;
  for (int index = 3; fields >> field; ++index) {
    if (index == 14) user = std::stoull(field);
    if (index == 15) {
      system = std::stoull(field);
      break;
    }
  }
  return static_cast<double>(user + system) / static_cast<double>(sysconf(_SC_CLK_TCK));
}

// A line of /proc/PID/status, such as VmRSS, in MiB.
inline double statusMebibytes(pid_t pid, std::string_view key) {
  std::ifstream status("/proc/" + std::to_string(pid) + "/status");
  for (std::string line; std::getline(status, line);) {
    if (line.starts_with(key) && line.size() > key.size() && line[key.size()] == ':') {
      return std::stod(line.substr(key.size() + 1)) / 1024.0;  // given in kB
    }
  }
  return 0.0;
}

}  // namespace cputime
