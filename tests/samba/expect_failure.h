#ifndef SAMBA_EXPECT_FAILURE_H
#define SAMBA_EXPECT_FAILURE_H

#include <gtest/gtest.h>

#include "common/status.h"

/// Expects that the statement throws a Failure with this status.
#define EXPECT_FAILURE(statement, status)                                       \
  try {                                                                         \
    statement;                                                                  \
    ADD_FAILURE() << "no failure";                                              \
  } catch (const sambaprovider::Failure& failure) {                             \
    EXPECT_EQ(failure.Code(), static_cast<uint32_t>(status)) << failure.what(); \
  }

#endif  // SAMBA_EXPECT_FAILURE_H
