// Pools: where blocks go, how they move and grow, and what happens to handles.
#include "util/memorymanager/memorymanager.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <cstring>
#include <functional>
#include <map>
#include <memory>
#include <span>
#include <string>
#include <utility>
#include <vector>

#include "support/allocation_failure.h"
#include "support/random.h"
#include "util/exception.h"
#include "util/memorymanager/alignedmemory.h"
#include "util/memorymanager/sharedarray.h"
#include "util/memorymanager/simplearray.h"

namespace {

class open_pool : public memorymanager {
 public:
  using memorymanager::base;
  using memorymanager::blocks;
  using memorymanager::memorymanager;
  using memorymanager::size;

  void garbagecollect() override {
    calls += 'g';
    if (collect) collect();
  }
  void monitor_enter() override { calls += '('; }
  void monitor_exit() override {
    calls += ')';
    if (exit_fails) throw new Exception("exit");
  }
  unsigned char* defragment() override {
    calls += 'd';
    return memorymanager::defragment();
  }

  std::function<void()> collect;
  std::string calls;
  bool exit_fails = false;
};

// The text of the failure that the body throws, which is deleted; its class by name.
template <class Failure>
std::string text_of(const std::function<void()>& body) {
  try {
    body();
  } catch (Exception* failure) {
    const std::unique_ptr<Exception> owned(failure);
    return dynamic_cast<Failure*>(failure) != nullptr ? failure->text()
                                                      : "another class: " + std::string(failure->text());
  }
  return "no failure";
}

// size times the 24-bit number 1.1 (0x8CCCCD / 2^23), rounded to 24 bits (ties to even), without its fraction.
unsigned int grown(unsigned int size) {
  const std::uint64_t product = std::uint64_t{size} * 0x8CCCCDu;
  const int width = product == 0 ? 0 : 64 - __builtin_clzll(product);
  const int drop = std::max(width - 24, 0);
  std::uint64_t kept = product >> drop;
  const std::uint64_t rest = product & ((std::uint64_t{1} << drop) - 1);
  const std::uint64_t half = drop == 0 ? 1 : std::uint64_t{1} << (drop - 1);
  if (rest > half || (rest == half && drop > 0 && (kept & 1) != 0)) ++kept;
  return static_cast<unsigned int>((kept << drop) >> 23);
}

std::size_t up(std::size_t offset, std::size_t alignment) { return (offset + alignment - 1) / alignment * alignment; }

// Random operations on a pool beside a model of it, which knows by offsets what every rule does.
class pool_model {
 public:
  pool_model(std::uint64_t seed, unsigned int size, bool moves)
      : random(seed), move_first(moves), pool(std::make_unique<open_pool>(size)), modelled_size(size) {
    pool->collect = [this] {
      ++collections;
      for (const int id : doomed) objects.erase(id);
    };
  }

  void step() {
    const int what = random.between(0, 9);
    if (what > 6) return allocate();
    if (what == 6 && random.one_in(8)) {
      pool->defragment();
      compact();
    }
    if (objects.empty()) return;
    if (what < 3) drop_handle(any());
    if (what == 3) copy_handle(any());
    if (what == 4) shrink(any());
    if (what == 5) reassign(any(), any());
  }

  void check() {
    ASSERT_EQ(pool->size, modelled_size);
    std::size_t total = 0;
    for (const auto& [id, owned] : objects) {
      ASSERT_EQ(owned.handles[0].block->length, static_cast<int>(owned.contents.size()));
      for (const auto& handle : owned.handles) {
        ASSERT_EQ(static_cast<std::size_t>(handle.address - pool->base), blocks.at(id).offset) << "block " << id;
        ASSERT_EQ(handle.address, handle.block->address);
      }
      ASSERT_TRUE(std::ranges::equal(owned.contents, std::span(owned.handles[0].address, owned.contents.size())));
      total += owned.contents.size();
    }
    ASSERT_EQ(allocatedmemory::allocated_size, static_cast<int>(total));
    ASSERT_EQ(pool->get_size(), total);
    ASSERT_EQ(pool->get_free_space(),
              blocks.empty() ? modelled_size : static_cast<unsigned int>(modelled_size - top()));
  }

  // The pool goes before the objects, or only its storage does: handles read null, and can still go one by one.
  void end(bool only_storage) {
    if (only_storage) {
      pool->release_resources();
    } else {
      pool.reset();
    }
    EXPECT_EQ(allocatedmemory::allocated_size, 0);
    while (!objects.empty()) {
      const int id = any();
      for (const auto& handle : objects.at(id).handles) EXPECT_EQ(handle.address, nullptr);
      if (random.one_in(3)) copy_handle(id);
      drop_handle(id);
    }
    EXPECT_EQ(allocatedmemory::allocated_size, 0);
  }

  int collections = 0;
  int growths = 0;

 private:
  struct placed {
    std::size_t offset, length, alignment;
  };
  struct owned_block {
    std::vector<unsigned char> contents;
    std::vector<allocatedmemory_autopointer> handles;
  };

  int any() { return std::next(objects.begin(), random.between(0, static_cast<int>(objects.size()) - 1))->first; }

  std::size_t top() const {
    return blocks.empty() ? 0 : blocks.rbegin()->second.offset + blocks.rbegin()->second.length;
  }
  void compact() {
    std::size_t end = 0;
    for (auto& [id, block] : blocks) {
      block.offset = up(end, block.alignment);
      end = block.offset + block.length;
    }
  }
  void grow() {
    ++growths;
    modelled_size = grown(modelled_size);
  }

  // Where the next block goes, and what happens to the others on the way.
  std::size_t place(std::size_t length, std::size_t alignment) {
    for (bool collect = true; !blocks.empty();) {
      for (const bool compacted : {false, true}) {
        if (compacted) compact();
        const std::size_t offset = up(top(), alignment);
        if (offset + length <= modelled_size) return offset;
      }
      if (!std::exchange(collect, false)) {
        grow();
        continue;
      }
      ++expected_collections;
      for (const int id : doomed) blocks.erase(id);
      compact();
      if (modelled_size < top() + 307200) grow();
    }
    while (length > modelled_size + std::size_t{memorymanager::slack}) grow();
    return 0;
  }

  void allocate() {
    const auto alignment = 1u << random.between(0, 4);
    std::vector<unsigned char> contents;
    if (!random.one_in(10))
      contents.resize(static_cast<std::size_t>(random.between(1, random.one_in(6) ? 400000 : 5000)));
    for (unsigned char& byte : contents) byte = static_cast<unsigned char>(random.word());
    doomed.clear();
    for (const auto& [id, block] : blocks) {
      if (random.one_in(5)) doomed.push_back(id);
    }
    if (move_first) compact();
    const std::size_t offset = place(contents.size(), std::max(alignment, 8u));
    const auto handle = pool->allocate(static_cast<unsigned int>(contents.size()), alignment);
    ASSERT_EQ(collections, expected_collections);
    std::ranges::copy(contents, handle.address);
    blocks[next_id] = {offset, contents.size(), std::max(alignment, 8u)};
    objects[next_id++] = {std::move(contents), {handle}};
  }

  void copy_handle(int id) {
    auto& handles = objects.at(id).handles;
    handles.emplace_back(allocatedmemory_autopointer(handles.front()));
  }
  void drop_handle(int id) {
    auto& handles = objects.at(id).handles;
    handles.erase(handles.begin() + random.between(0, static_cast<int>(handles.size()) - 1));
    if (!handles.empty()) return;
    objects.erase(id);
    blocks.erase(id);
  }
  void shrink(int id) {
    auto& [contents, handles] = objects.at(id);
    contents.resize(static_cast<std::size_t>(random.between(0, static_cast<int>(contents.size()))));
    blocks.at(id).length = contents.size();
    handles.front().resize(static_cast<unsigned int>(contents.size()));
  }
  // A handle leaves its block for another one, or for its own.
  void reassign(int from, int to) {
    auto& handle = objects.at(from).handles.back();
    handle = objects.at(to).handles.front();
    if (from == to) return;
    objects.at(to).handles.push_back(handle);
    objects.at(from).handles.pop_back();
    if (!objects.at(from).handles.empty()) return;
    objects.erase(from);
    blocks.erase(from);
  }

  test_random random;
  const bool move_first;
  std::unique_ptr<open_pool> pool;
  std::map<int, placed> blocks;  // by age, and so by address
  std::map<int, owned_block> objects;
  std::vector<int> doomed;  // what the client would give up in a collection
  unsigned int modelled_size;
  int next_id = 0;
  int expected_collections = 0;
};

class pools : public testing::Test {
 public:
  const bool moved_before = memorymanager::move_at_every_allocation;
  void SetUp() override {
    memorymanager::move_at_every_allocation = false;
    ASSERT_EQ(allocatedmemory::allocated_size, 0);
  }
  void TearDown() override {
    memorymanager::move_at_every_allocation = moved_before;
    allocation_failure::none();
    EXPECT_EQ(allocatedmemory::allocated_size, 0);
  }
};

TEST_F(pools, random_operations_follow_the_model) {
  int collections = 0;
  int growths = 0;
  for (int run = 0; run < 12; ++run) {
    SCOPED_TRACE("run " + std::to_string(run));
    const bool moves = run % 3 == 2;
    memorymanager::move_at_every_allocation = moves;
    allocation_failure::move_realloc(run % 2 == 1, 32);
    pool_model model(static_cast<std::uint64_t>(run), run < 6 ? 40000 : 700000, moves);
    for (int i = 0; i < 400; ++i) {
      model.step();
      if (i % 8 == 0) model.check();
      if (HasFatalFailure()) return;
    }
    model.check();
    model.end(run % 4 < 2);
    collections += model.collections;
    growths += model.growths;
  }
  // The runs reach what they are for.
  EXPECT_GT(collections, 30);
  EXPECT_GT(growths, 30);
}

TEST_F(pools, storage_is_aligned_zeroed_and_filled_to_its_last_byte) {
  open_pool pool(1000);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(pool.base) % 128, 0u);
  EXPECT_EQ(std::count(pool.base, pool.base + 1000, 0), 1000);
  const auto first = pool.allocate(504), second = pool.allocate(496);
  EXPECT_EQ(pool.get_free_space(), 0u);
  const auto none = pool.allocate(0, 1);  // still fits, at the very end
  EXPECT_EQ(none.address, pool.base + 1000);
  EXPECT_EQ(pool.calls, "()()()");
}

TEST_F(pools, an_empty_pool_takes_a_first_block_up_to_the_end_of_its_slack) {
  for (const unsigned int beyond : {0u, 1u}) {
    open_pool pool(1000);
    const unsigned int length = 1000 + memorymanager::slack + beyond;
    std::memset(pool.allocate(length).address, 1, length);
    EXPECT_EQ(pool.size, beyond == 0 ? 1000u : 1100u);
  }
}

TEST_F(pools, growth_is_a_tenth_in_single_precision) {
  for (const unsigned int size : {10u, 19u, 99u, 9999999u, (1u << 24) - 3, (1u << 24) + 1, 18000001u, 33554435u}) {
    open_pool pool(size);
    pool.resizepool();
    EXPECT_EQ(pool.size, grown(size)) << size;
  }
  EXPECT_EQ(grown(100), 110u);
  EXPECT_EQ(grown(33554435) % 4, 0u) << "far above 2^24 only fourth numbers are left";
}

TEST_F(pools, growth_that_cannot_be_had_leaves_the_pool_as_it_was) {
  open_pool pool(100000);
  auto block = pool.allocate(90000);
  std::memset(block.address, 5, 90000);
  unsigned char* const before = block.address;
  allocation_failure::fail_realloc(true);
  EXPECT_EQ(text_of<OutOfMemory>([&] { pool.allocate(20000); }), "native(MPR: 107)");
  allocation_failure::fail_realloc(false);
  EXPECT_EQ(pool.calls, "()(dgd");
  EXPECT_EQ(pool.size, 100000u);
  EXPECT_EQ(block.address, before);
  EXPECT_EQ(pool.get_size(), 90000u);
  EXPECT_EQ(pool.blocks.next, block.block);
  const auto more = pool.allocate(20000);  // growing may move the pool
  EXPECT_EQ(more.address, block.block->endadr());

  // A tenth of nothing: growing would never end.
  for (const unsigned int size : {0u, 1u, 9u}) {
    open_pool tiny(size);
    const auto first = tiny.allocate(8);
    EXPECT_EQ(text_of<OutOfMemory>([&] { tiny.allocate(8); }), "native(MPR: 0)") << size;
  }
  // No block is longer than 31 bits can tell, and none wraps to a few bytes.
  EXPECT_EQ(text_of<OutOfMemory>([&] { pool.allocate(0x80000000u); }), "native(MPR: 2097152)");
  EXPECT_EQ(text_of<OutOfMemory>([&] { sharedarray<int>::allocate(pool, 0x40000001u); }), "native(MPR: 4194303)");
}

TEST_F(pools, blocks_keep_their_bytes_when_growth_moves_them_to_another_phase) {
  for (const unsigned int phase : {16u, 48u, 64u, 112u}) {
    test_random random(phase);
    open_pool pool(4000);
    std::vector<allocatedmemory_autopointer> handles;
    for (int i = 0; i < 40; ++i) {
      handles.push_back(pool.allocate(static_cast<unsigned int>(random.between(1, 90)), 8u << random.between(0, 4)));
      EXPECT_EQ(reinterpret_cast<std::uintptr_t>(handles.back().address) % handles.back().block->alignment, 0u);
      std::memset(handles.back().address, i, static_cast<std::size_t>(handles.back().block->length));
    }
    allocation_failure::move_realloc(true, phase);
    pool.resizepool();
    allocation_failure::move_realloc(false);
#ifndef __SANITIZE_ADDRESS__  // Its heap has few phases, and may not have this one.
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(pool.base) % 128, phase);
#endif
    pool.defragment();
    for (int i = 0; i < 40; ++i) {
      const allocatedmemory& block = *handles[static_cast<std::size_t>(i)].block;
      EXPECT_EQ(reinterpret_cast<std::uintptr_t>(block.address) % block.alignment, 0u);
      EXPECT_EQ(std::count(block.address, block.endadr(), static_cast<unsigned char>(i)), block.length);
    }
  }
}

TEST_F(pools, failed_storage_has_the_systems_text) {
  allocation_failure::fail_memalign(1, ENOMEM);
  EXPECT_EQ(text_of<RuntimeException>([] { open_pool pool(1000); }), "Cannot allocate memory");
  allocation_failure::fail_memalign(1, EINVAL);
  EXPECT_EQ(text_of<RuntimeException>([] { _aligned_malloc(16, 16); }), "Invalid argument");
  // A null without an error is tried once more.
  allocation_failure::fail_memalign(1, 0);
  EXPECT_EQ(text_of<OutOfMemory>([] { open_pool pool(1000); }), "no failure");
  allocation_failure::fail_memalign(1, 0);
  EXPECT_EQ(text_of<OutOfMemory>([] { simplearray<int> array(10); }), "native(SIA)");
  EXPECT_EQ(text_of<OutOfMemory>([] { simplearray<char[sizeof(void*) * 1024]> a(sizeof(void*) == 4 ? INT32_MAX : 0); }),
            sizeof(void*) == 4 ? "native(SIA)" : "no failure");

  for (const std::size_t alignment : {1u, 8u, 16u, 64u, 4096u}) {
    void* const p = _aligned_malloc(100, alignment);
    EXPECT_EQ(reinterpret_cast<std::uintptr_t>(p) % std::max<std::size_t>(alignment, 8), 0u);
    _aligned_free(p);
  }
}

TEST_F(pools, a_failing_monitor_frees_the_block_and_released_storage_serves_no_more) {
  open_pool pool(1000);
  pool.exit_fails = true;
  EXPECT_EQ(text_of<Exception>([&] { pool.allocate(100); }), "exit");
  EXPECT_TRUE(pool.blocks.isempty() && pool.get_size() == 0);
  pool.exit_fails = false;
  const auto block = pool.allocate(100);
  pool.release_resources();
  pool.release_resources();
  EXPECT_TRUE(pool.size == 1000 && !pool.blocks.isempty());
  EXPECT_EQ(text_of<IllegalStateException>([&] { pool.allocate(10); }), "the pool's storage is released");
}

using pools_death = pools;
TEST_F(pools_death, a_block_does_not_grow) {
  open_pool pool(1000);
  auto block = pool.allocate(100);
  EXPECT_DEATH(block.resize(101),
               "../util/memorymanager/allocatedmemory:44: void allocatedmemory::resize\\(s32\\): Assertion "
               "`newlength<=length' failed");
}

TEST_F(pools, typed_arrays_share_shrink_and_let_go) {
  open_pool pool(10000);
  auto words = sharedarray<unsigned short>::allocate(pool, 100);
  EXPECT_EQ(words.block->length, 200);
  const sharedarray<unsigned short> shared = words;
  words.resize(30);
  EXPECT_TRUE(shared.count() == 30 && pool.get_size() == 60);
  words[29] = 4711;
  words = {};
  EXPECT_EQ(shared[29], 4711);
  EXPECT_NE(sharedarray<int>::allocate(pool, 0).block, nullptr);
  struct alignas(16) wide {
    float lanes[4];
  };
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(sharedarray<wide>::allocate(pool, 2).data()) % 16, 0u);
  {
    simplearray<sharedarray<unsigned char>> many(5), none(-1);
    EXPECT_EQ(many[4].block, nullptr);
    for (int i = 0; i < 5; ++i) many[i] = sharedarray<unsigned char>::allocate(pool, 10);
    none.swap(many);
    EXPECT_TRUE(many.count == -1 && pool.get_size() == 110);
  }
  EXPECT_EQ(pool.get_size(), 60u);
}

}  // namespace
