// The service as a whole.
#ifndef CAMD_SERVICE_SERVICE_H
#define CAMD_SERVICE_SERVICE_H

#include <string>

namespace camd {

// Serves until SIGTERM or SIGINT, with the configuration file at `path`, which it reads again at SIGHUP. Must
// be called while the process has one thread. Throws ConfigurationError, Failure, DatabaseError or
// WebServerError when it cannot begin.
void Serve(const std::string& path);

// Reads the configuration file and the files that it names, and changes nothing. Passes over credentials of
// systemd that this process does not have, and prints their names. Throws as Serve.
void Check(const std::string& path);

}  // namespace camd

#endif  // CAMD_SERVICE_SERVICE_H
