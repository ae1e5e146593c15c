/// The application that commands are added to, and its options. Only the files that add some include
/// <CLI/App.hpp> itself, which takes a compiler longer than the rest of most files.
#ifndef VELMORCTL_COMMAND_LINE_H
#define VELMORCTL_COMMAND_LINE_H

namespace CLI {
class App;
class Option;
}  // namespace CLI

#endif  // VELMORCTL_COMMAND_LINE_H
