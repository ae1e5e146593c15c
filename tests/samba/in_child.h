#ifndef SAMBA_IN_CHILD_H
#define SAMBA_IN_CHILD_H

#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include "common/status.h"

/// Does the work in a process of its own and returns its status. libnetapi keeps Samba's secrets open until
/// its process ends, so that nobody could look into them, and loses memory.
template <typename Work>
uint32_t StatusInChild(const Work& work) {
  int ends[2];
  if (pipe(ends) != 0) {
    ADD_FAILURE() << "no pipe";
    return 0;
  }
  const pid_t child = fork();
  if (child == 0) {
    uint32_t status = sambaprovider::kSuccess;
    try {
      work();
    } catch (const sambaprovider::Failure& failure) {
      status = failure.Code();
    }
    _exit(write(ends[1], &status, sizeof status) == sizeof status ? 0 : 1);
  }
  close(ends[1]);
  uint32_t status = 0;
  EXPECT_EQ(read(ends[0], &status, sizeof status), static_cast<ssize_t>(sizeof status)) << "the child died";
  close(ends[0]);
  waitpid(child, nullptr, 0);
  return status;
}

#endif  // SAMBA_IN_CHILD_H
