#ifndef BENCHMARKS_SYSTEMCONFIGURATION_AUGEAS_TREE_H
#define BENCHMARKS_SYSTEMCONFIGURATION_AUGEAS_TREE_H

#include <memory>
#include <string>

struct augeas;

/// One text in an Augeas tree. Its lenses are compiled before the first text is read.
class AugeasTree {
 public:
  explicit AugeasTree(std::string lens);

  /// Puts the text in; throws std::runtime_error when the lens refuses it.
  void Store(const std::string& text);

  /// Makes the tree a text again.
  void Retrieve();

 private:
  struct Close {
    void operator()(augeas* handle) const;
  };

  std::string lens_;
  std::unique_ptr<augeas, Close> handle_;
};

#endif
