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
#include <string>
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
      for (const int id : doomed) live.erase(id);
    };
  }

  void step() {
    switch (random.between(0, 9)) {
      case 0:
        if (live.empty()) return;
        return copy_handle();
      case 1:
      case 2:
      case 3:
        if (live.empty()) return;
        return drop_handle(any());
      case 4:
        if (live.empty()) return;
        return shrink(any());
      case 5:
        if (!random.one_in(8)) return;
        pool->defragment();
        compact();
        return;
      case 6:
        if (live.size() < 2) return;
        return reassign();
      default:
        return allocate();
    }
  }

  void check() {
    ASSERT_EQ(pool->size, modelled_size);
    int total = 0;
    for (auto& [id, block] : live) {
      ASSERT_EQ(block.handles.front().block->length, static_cast<int>(block.contents.size()));
      for (const auto& handle : block.handles) {
        ASSERT_EQ(static_cast<std::size_t>(handle.address - pool->base), block.offset) << "block " << id;
        ASSERT_EQ(handle.address, handle.block->address);
      }
      ASSERT_TRUE(std::equal(block.contents.begin(), block.contents.end(), block.handles.front().address)) << id;
      total += static_cast<int>(block.contents.size());
    }
    ASSERT_EQ(allocatedmemory::allocated_size, total);
    ASSERT_EQ(pool->get_size(), static_cast<unsigned int>(total));
    ASSERT_EQ(pool->get_free_space(), live.empty() ? modelled_size : static_cast<unsigned int>(modelled_size - top()));
  }

  // The pool goes before the objects, or only its storage does: handles read null, and can still go one by one.
  void end(bool only_storage) {
    std::unique_ptr<open_pool> kept;
    if (only_storage) {
      pool->release_resources();
    } else {
      pool.reset();
    }
    EXPECT_EQ(allocatedmemory::allocated_size, 0);
    while (!live.empty()) {
      for (const auto& handle : any()->second.handles) EXPECT_EQ(handle.address, nullptr);
      if (random.one_in(3)) copy_handle();
      drop_handle(any());
    }
    EXPECT_EQ(allocatedmemory::allocated_size, 0);
  }

  int collections = 0;
  int growths = 0;

 private:
  struct entry {
    std::size_t offset;
    unsigned int alignment;
    std::vector<unsigned char> contents;
    std::vector<allocatedmemory_autopointer> handles;
  };
  using table = std::map<int, entry>;  // by age, and so by address

  table::iterator any() { return std::next(live.begin(), random.between(0, static_cast<int>(live.size()) - 1)); }

  std::size_t top() const {
    const entry& newest = live.rbegin()->second;
    return newest.offset + newest.contents.size();
  }

  std::size_t compact() {
    std::size_t end = 0;
    for (auto& [id, block] : live) {
      block.offset = up(end, block.alignment);
      end = block.offset + block.contents.size();
    }
    return end;
  }

  void grow() {
    ++growths;
    modelled_size = grown(modelled_size);
  }

  // What a collection leaves: the same as `live` without the doomed, which the real pool's callback has yet to drop.
  std::size_t place(std::size_t length, unsigned int alignment, table& survivors) {
    live.swap(survivors);
    bool collect = true;
    std::size_t offset = 0;
    for (;;) {
      if (live.empty()) {
        while (length > modelled_size + std::size_t{204800}) grow();
        offset = 0;
        break;
      }
      offset = up(top(), alignment);
      if (offset + length <= modelled_size) break;
      offset = up(compact(), alignment);
      if (offset + length <= modelled_size) break;
      if (collect) {
        for (const int id : doomed) live.erase(id);
        ++expected_collections;
        compact();
        const auto tail = static_cast<long long>(modelled_size) - static_cast<long long>(live.empty() ? 0 : top());
        if (tail < 307200) grow();
        collect = false;
      } else {
        grow();
      }
    }
    live.swap(survivors);
    return offset;
  }

  void allocate() {
    static constexpr unsigned int alignments[] = {1, 2, 4, 8, 16};
    const unsigned int alignment = alignments[random.between(0, 4)];
    const int length = random.one_in(10) ? 0 : random.between(1, random.one_in(6) ? 200000 : 5000);
    doomed.clear();
    for (const auto& [id, block] : live) {
      if (random.one_in(5)) doomed.push_back(id);
    }
    // The model runs on a copy of the offsets: the real handles must stay until the pool itself has moved.
    table plan;
    for (const auto& [id, block] : live) plan[id] = {block.offset, block.alignment, block.contents, {}};
    if (move_first) {
      live.swap(plan);
      compact();
      live.swap(plan);
    }
    const std::size_t offset = place(static_cast<std::size_t>(length), std::max(alignment, 8u), plan);

    auto handle = pool->allocate(static_cast<unsigned int>(length), alignment);
    ASSERT_EQ(collections, expected_collections);
    for (auto& [id, block] : live) block.offset = plan.at(id).offset;
    entry made{offset, std::max(alignment, 8u), std::vector<unsigned char>(static_cast<std::size_t>(length)), {}};
    for (unsigned char& byte : made.contents) byte = static_cast<unsigned char>(random.word());
    if (length > 0) std::memcpy(handle.address, made.contents.data(), made.contents.size());
    made.handles.push_back(handle);
    live[next_id++] = std::move(made);
  }

  void copy_handle() {
    auto& handles = any()->second.handles;
    handles.emplace_back(allocatedmemory_autopointer(handles.front()));
  }
  void drop_handle(table::iterator at) {
    auto& handles = at->second.handles;
    handles.erase(handles.begin() + random.between(0, static_cast<int>(handles.size()) - 1));
    if (handles.empty()) live.erase(at);
  }
  void shrink(table::iterator at) {
    auto& contents = at->second.contents;
    contents.resize(static_cast<std::size_t>(random.between(0, static_cast<int>(contents.size()))));
    at->second.handles.front().resize(static_cast<unsigned int>(contents.size()));
  }
  // A handle leaves its block for another one, or for its own.
  void reassign() {
    const auto from = any();
    const auto to = any();
    from->second.handles.back() = to->second.handles.front();
    if (from == to) return;
    to->second.handles.push_back(from->second.handles.back());
    from->second.handles.pop_back();
    if (from->second.handles.empty()) live.erase(from);
  }

  test_random random;
  const bool move_first;
  std::unique_ptr<open_pool> pool;
  table live;
  std::vector<int> doomed;
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
    allocation_failure::fail_memalign(0, 0);
    allocation_failure::fail_realloc(false);
    allocation_failure::move_realloc(false);
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
  EXPECT_TRUE(std::all_of(pool.base, pool.base + 1000, [](unsigned char b) { return b == 0; }));
  EXPECT_EQ(pool.get_free_space(), 1000u);

  const auto first = pool.allocate(504);
  const auto second = pool.allocate(496);
  EXPECT_EQ(first.address, pool.base);
  EXPECT_EQ(second.address, pool.base + 504);
  EXPECT_EQ(pool.get_free_space(), 0u);
  // A block of no bytes still fits, at the very end, and asks nobody.
  const auto none = pool.allocate(0, 1);
  EXPECT_EQ(none.address, pool.base + 1000);
  EXPECT_EQ(pool.calls, "()()()");
  EXPECT_EQ(pool.get_size(), 1000u);
}

TEST_F(pools, room_is_sought_by_compaction_then_collection_then_growth) {
  open_pool pool(400000);
  auto gap = pool.allocate(100000);
  auto kept = pool.allocate(200000);
  std::memset(kept.address, 7, 200000);
  gap = allocatedmemory_autopointer();
  pool.calls.clear();

  // The gap comes back by sliding the kept block down; the client is not asked.
  auto third = pool.allocate(150000);
  EXPECT_EQ(pool.calls, "(d)");
  EXPECT_EQ(kept.address, pool.base);
  EXPECT_EQ(kept.address[199999], 7);
  pool.calls.clear();

  // The client drops a block; a tail under 307200 bytes grows all the same, though the block would fit now.
  pool.collect = [&] { third = allocatedmemory_autopointer(); };
  const auto fourth = pool.allocate(100000);
  EXPECT_EQ(pool.calls, "(dgd)");
  EXPECT_EQ(pool.size, 440000u);
  EXPECT_EQ(fourth.address, pool.base + 200000);
  pool.calls.clear();

  // What no collection can give grows until it fits, with a compaction before each further step.
  const auto large = pool.allocate(300000);
  EXPECT_EQ(pool.calls, "(dgdddd)");
  EXPECT_EQ(pool.size, grown(grown(grown(grown(440000)))));
}

TEST_F(pools, a_comfortable_tail_is_not_grown_before_it_is_tried) {
  open_pool pool(1000000);
  auto dropped = pool.allocate(600000);
  const auto kept = pool.allocate(200000);
  pool.collect = [&] { dropped = allocatedmemory_autopointer(); };
  // 800000 bytes are free after the collection.
  const auto fits = pool.allocate(800000);
  EXPECT_EQ(pool.size, 1000000u);
  EXPECT_EQ(pool.calls, "()()(dgd)");
}

TEST_F(pools, growth_is_a_tenth_in_single_precision) {
  for (const unsigned int size : {10u, 11u, 19u, 99u, 100u, 1000000u, 9999999u, (1u << 24) - 3, (1u << 24) + 1,
                                  18000001u, 25165823u, 33554435u}) {
    open_pool pool(size);
    pool.resizepool();
    EXPECT_EQ(pool.size, grown(size)) << size;
  }
  EXPECT_EQ(grown(10), 11u);
  EXPECT_EQ(grown(100), 110u);
  // Above 2^24 only even, then only fourth numbers are left.
  EXPECT_EQ(grown(18000001) % 2, 0u);
  EXPECT_EQ(grown(33554435) % 4, 0u);
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

TEST_F(pools, an_empty_pool_takes_any_first_block) {
  open_pool pool(1000);
  {
    const auto overrun = pool.allocate(1000 + memorymanager::slack);
    EXPECT_EQ(overrun.address, pool.base);
    std::memset(overrun.address, 1, 1000 + memorymanager::slack);
    EXPECT_EQ(pool.size, 1000u);
  }
  const auto longer = pool.allocate(1001 + memorymanager::slack);
  EXPECT_EQ(longer.address, pool.base);
  EXPECT_EQ(pool.size, 1100u);
  EXPECT_EQ(pool.calls, "()()");
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

TEST_F(pools, a_failing_monitor_frees_the_block) {
  open_pool pool(1000);
  pool.exit_fails = true;
  EXPECT_EQ(text_of<Exception>([&] { pool.allocate(100); }), "exit");
  EXPECT_EQ(pool.get_size(), 0u);
  EXPECT_TRUE(pool.blocks.isempty());
}

TEST_F(pools, released_storage_serves_no_more) {
  open_pool pool(1000);
  const auto block = pool.allocate(100);
  pool.release_resources();
  pool.release_resources();
  EXPECT_EQ(pool.size, 1000u);
  EXPECT_FALSE(pool.blocks.isempty());
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
  EXPECT_EQ(words.manager, &pool);
  const sharedarray<unsigned short> shared = words;
  words.resize(30);
  EXPECT_EQ(shared.count(), 30);
  EXPECT_EQ(pool.get_size(), 60u);
  words[29] = 4711;
  words = {};
  EXPECT_EQ(shared[29], 4711);
  EXPECT_NE(sharedarray<int>::allocate(pool, 0).block, nullptr);

  struct alignas(16) wide {
    float lanes[4];
  };
  const auto vectors = sharedarray<wide>::allocate(pool, 2);
  EXPECT_EQ(reinterpret_cast<std::uintptr_t>(vectors.data()) % 16, 0u);
  {
    simplearray<sharedarray<unsigned char>> many(5);
    for (int i = 0; i < 5; ++i) {
      EXPECT_EQ(many[i].block, nullptr);
      many[i] = sharedarray<unsigned char>::allocate(pool, 10);
    }
    EXPECT_EQ(pool.get_size(), 60u + 32u + 50u);
    simplearray<sharedarray<unsigned char>> none(-1);
    none.swap(many);
    EXPECT_EQ(many.count, -1);
  }
  EXPECT_EQ(pool.get_size(), 60u + 32u);
}

}  // namespace
