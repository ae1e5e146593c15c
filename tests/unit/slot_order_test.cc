// The order of virtual operations is part of the library's binary interface. It is read here the way that a
// caller's code uses it: from the object's table of functions.

#include <gtest/gtest.h>

#include <cstring>
#include <memory>
#include <string>
#include <vector>

#include "authentication/authentication.h"
#include "support/files.h"

namespace quenix::authentication {
namespace {

/// One entry of the object's table of virtual functions.
void* Slot(const void* object, std::size_t index) {
  void** table = nullptr;
  std::memcpy(&table, object, sizeof table);
  return table[index];
}

/// The index at which the platform's ABI places a virtual operation (its byte offset plus one is what a
/// pointer to member holds).
template <class Member>
std::size_t IndexOf(Member member) {
  std::size_t words[2] = {};
  static_assert(sizeof member == sizeof words);
  std::memcpy(words, &member, sizeof words);
  EXPECT_EQ(words[0] % 2, 1U) << "not virtual";
  return (words[0] - 1) / sizeof(void*);
}

// The two destructor entries stand where the destructor is declared.

TEST(SlotOrderTest, OfException) {
  EXPECT_EQ(IndexOf(&Exception::what), 2U);
  EXPECT_EQ(IndexOf(&Exception::Clone), 3U);
  EXPECT_EQ(IndexOf(&Exception::Throw), 4U);
  const InvalidKeyException exception("k");
  const Exception& base = exception;
  using What = const char* (*)(const void*);
  EXPECT_STREQ(reinterpret_cast<What>(Slot(&exception, 2))(&exception), base.what());
}

TEST(SlotOrderTest, OfAuthenticationStore) {
  EXPECT_EQ(IndexOf(&AuthenticationStore::GetStoreConfiguration), 0U);
  EXPECT_EQ(IndexOf(&AuthenticationStore::GetDisplayName), 1U);
  EXPECT_EQ(IndexOf(&AuthenticationStore::IsActive), 2U);
  EXPECT_EQ(IndexOf(&AuthenticationStore::MakeActive), 3U);
}

TEST(SlotOrderTest, OfRemoteAuthenticationStore) {
  EXPECT_EQ(IndexOf(&RemoteAuthenticationStore::IsActive), 2U);
  // 4 and 5 are the destructor's.
  EXPECT_EQ(IndexOf(&RemoteAuthenticationStore::MakeInactive), 6U);
}

TEST(SlotOrderTest, OfTheConcreteStores) {
  EXPECT_EQ(IndexOf(&NoRemoteAuthenticationStore::MakeInactive), 6U);
  EXPECT_EQ(IndexOf(&ActiveDirectoryStore::MakeInactive), 6U);
  EXPECT_EQ(IndexOf(&ActiveDirectoryStore::MakeActive), 3U);
  EXPECT_EQ(IndexOf(&ActiveDirectoryStore::GetStoreConfiguration), 0U);
}

TEST(SlotOrderTest, OfConfiguration) {
  // 0 and 1 are the destructor's.
  EXPECT_EQ(IndexOf(&Configuration::Write), 2U);
  EXPECT_EQ(IndexOf(&ProviderConfiguration::Write), 2U);
}

TEST(SlotOrderTest, TheDeletingDestructorOfAStoreIsInSlotFive) {
  class Watched : public NoRemoteAuthenticationStore {
   public:
    explicit Watched(bool& ended) : ended_(ended) {}
    ~Watched() override { ended_ = true; }

   private:
    bool& ended_;
  };
  bool ended = false;
  auto* store = new Watched(ended);
  using Delete = void (*)(void*);
  reinterpret_cast<Delete>(Slot(store, 5))(store);
  EXPECT_TRUE(ended);
}

}  // namespace
}  // namespace quenix::authentication
