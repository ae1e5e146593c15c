#include "augeas_tree.h"

#include <augeas.h>

#include <stdexcept>
#include <utility>

void AugeasTree::Close::operator()(augeas* handle) const {
  aug_close(handle);
}

AugeasTree::AugeasTree(std::string lens)
    : lens_(std::move(lens)), handle_(aug_init(nullptr, nullptr, AUG_NO_LOAD | AUG_NO_MODL_AUTOLOAD)) {
  if (!handle_) throw std::runtime_error("aug_init failed");
  Store("");
}

void AugeasTree::Store(const std::string& text) {
  aug_rm(handle_.get(), "/tree");
  if (aug_set(handle_.get(), "/text", text.c_str()) != 0 ||
      aug_text_store(handle_.get(), lens_.c_str(), "/text", "/tree") != 0) {
    throw std::runtime_error("Augeas does not read the text: " +
                             std::string(aug_error_message(handle_.get())));
  }
}

void AugeasTree::Retrieve() {
  if (aug_text_retrieve(handle_.get(), lens_.c_str(), "/text", "/tree", "/written") != 0) {
    throw std::runtime_error("Augeas does not write the tree: " +
                             std::string(aug_error_message(handle_.get())));
  }
}
