#ifndef PLATFORM_SYSTEM_RUN_PROGRAM_H
#define PLATFORM_SYSTEM_RUN_PROGRAM_H

#include <string>
#include <vector>

namespace HostMgmt::System {

/// Runs a program to its end: `arguments` begins with the program's absolute path, and no shell is between.
/// The program gets a fixed environment, no input and no descriptor of ours, and its output is dropped. It is
/// killed after thirty seconds, with all that it started. Throws Lib::HostMgmtException "Unable to run
/// '<program>': <reason>" when it cannot be started, takes too long, is killed, or ends with a status other
/// than 0.
void RunProgram(const std::vector<std::string>& arguments);

}  // namespace HostMgmt::System

#endif
