#pragma once

#include <algorithm>
#include <cstddef>
#include <cstdlib>
#include <memory>
#include <random>
#include <span>
#include <string>
#include <utility>
#include <vector>

// Where objects and buffers lie moves a row by up to a factor of two. So it is left to chance, anew for every
// sample.
namespace bench {

// The same in every run, unless it is seeded.
inline std::mt19937_64& placementChance() {
  static std::mt19937_64 engine;
  return engine;
}

// Blocks of any size, taken from the heap so that what comes after them lies elsewhere than the last time.
inline std::vector<std::unique_ptr<char[]>> scatteredBlocks() {
  std::mt19937_64& chance = placementChance();
  std::vector<std::unique_ptr<char[]>> blocks(chance() % 64);
  for (auto& block : blocks) block.reset(new char[16 + chance() % 1024]);
  // Some are given back: holes, as a heap in use has them.
  std::ranges::shuffle(blocks, chance);
  blocks.resize(blocks.size() / 2 + 1);
  return blocks;
}

// Objects that live as long as this or a copy of it. Where there are many, their order in memory is not the
// order of their numbers.
template <class T>
class Objects {
 public:
  explicit Objects(std::vector<std::unique_ptr<T>> objects)
      : owner_(std::make_shared<const std::vector<std::unique_ptr<T>>>(shuffled(std::move(objects)))),
        objects_(owner_->data()),
        size_(owner_->size()) {}

  T& operator[](std::size_t at) const { return *objects_[at]; }
  std::size_t size() const { return size_; }

 private:
  static auto shuffled(std::vector<std::unique_ptr<T>> objects) {
    std::ranges::shuffle(objects, placementChance());
    return objects;
  }

  std::shared_ptr<const std::vector<std::unique_ptr<T>>> owner_;
  const std::unique_ptr<T>* objects_;
  std::size_t size_;
};

// Makes one object for each of the bytes.
template <class T, class Make>
Objects<T> objectsFor(const auto& bytes, Make make) {
  std::vector<std::unique_ptr<T>> objects;
  objects.reserve(bytes.size());
  for (const auto& message : bytes) objects.push_back(make(message));
  return Objects<T>(std::move(objects));
}

// A caller's buffer. It starts with a page: where the heap happens to put a short one across two, encoding
// into it takes up to three times as long.
class PageBuffer {
 public:
  explicit PageBuffer(std::size_t size)
      : memory_(static_cast<char*>(std::aligned_alloc(page, (size + page - 1) / page * page)), std::free),
        span_(memory_.get(), size) {}

  operator std::span<char>() const { return span_; }  // NOLINT(google-explicit-constructor): it is one

 private:
  static constexpr std::size_t page = 4096;

  std::shared_ptr<char> memory_;
  std::span<char> span_;
};

}  // namespace bench
