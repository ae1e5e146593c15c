#include "plugin/result_memory.h"

#include <cstdlib>
#include <cstring>
#include <new>

namespace sambaprovider {
namespace {

char* Allocate(size_t size) {
  void* memory = malloc(size);
  if (memory == nullptr) throw std::bad_alloc();
  return static_cast<char*>(memory);
}

// Copies a text with its terminator and moves the place on.
char* Append(char*& place, const std::string& text) {
  char* const copy = place;
  memcpy(copy, text.c_str(), text.size() + 1);
  place += text.size() + 1;
  return copy;
}

}  // namespace

extern "C" void ReleaseResult(void* memory) {
  free(memory);
}

char* CopyForCaller(const std::string& text) {
  char* place = Allocate(text.size() + 1);
  return Append(place, text);
}

char** CopyForCaller(const std::vector<std::string>& texts) {
  size_t size = (texts.size() + 1) * sizeof(char*);
  for (const std::string& text : texts) size += text.size() + 1;
  char* const block = Allocate(size);
  char** const names = reinterpret_cast<char**>(block);
  char* place = block + (texts.size() + 1) * sizeof(char*);
  char** next = names;
  for (const std::string& text : texts) *next++ = Append(place, text);
  *next = nullptr;
  return names;
}

ActiveDirectoryDomainPair** CopyForCaller(const std::vector<DomainNames>& domains) {
  using Pair = ActiveDirectoryDomainPair;
  const size_t pointers = (domains.size() + 1) * sizeof(Pair*);
  size_t size = pointers + domains.size() * sizeof(Pair);
  for (const DomainNames& domain : domains) size += domain.dnsName.size() + domain.netbiosName.size() + 2;
  char* const block = Allocate(size);
  Pair** const result = reinterpret_cast<Pair**>(block);
  Pair* pair = reinterpret_cast<Pair*>(block + pointers);
  char* place = block + pointers + domains.size() * sizeof(Pair);
  Pair** next = result;
  for (const DomainNames& domain : domains) {
    pair->dnsName = Append(place, domain.dnsName);
    pair->netbiosName = Append(place, domain.netbiosName);
    *next++ = pair++;
  }
  *next = nullptr;
  return result;
}

}  // namespace sambaprovider
