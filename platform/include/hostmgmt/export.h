#ifndef HOSTMGMT_EXPORT_H
#define HOSTMGMT_EXPORT_H

/// Marks what the host platform layer offers to programs outside the library. On a class it also makes the
/// class's one typeinfo visible, so that an exception thrown inside the library is caught by its class in
/// every program and module of the process.
#define HOSTMGMT_EXPORT __attribute__((visibility("default")))

#endif
