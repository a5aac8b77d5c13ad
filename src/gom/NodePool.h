// A per-thread cache of equal-sized memory blocks for the object model's
// most frequent nodes (variants and generic objects). Reading a measurement
// tree makes and drops hundreds of them; taking a block from the thread's own
// list costs a few instructions where the general allocator costs tens.
//
// A block freed on another thread than the one that made it simply joins
// that thread's list. Each list keeps at most kLimit blocks; the rest go
// back to the general allocator, as do all blocks when the thread ends.
// Under the sanitizers the cache is off, so that they see every allocation.
#ifndef LODESTACK_SRC_GOM_NODEPOOL_H
#define LODESTACK_SRC_GOM_NODEPOOL_H

#include <cstddef>
#include <new>

#include <pthread.h>

#if defined(__SANITIZE_ADDRESS__) || defined(__SANITIZE_THREAD__)
#define LODESTACK_NODE_POOL 0
#elif defined(__has_feature)
#if __has_feature(address_sanitizer) || __has_feature(thread_sanitizer) || \
    __has_feature(memory_sanitizer)
#define LODESTACK_NODE_POOL 0
#endif
#endif
#ifndef LODESTACK_NODE_POOL
#define LODESTACK_NODE_POOL 1
#endif

namespace lodestack {
namespace gom {

template <std::size_t Size>
class NodePool {
 public:
  // A block of `size` bytes; null when memory is exhausted.
  static void* allocate(std::size_t size) noexcept {
#if LODESTACK_NODE_POOL
    if (size == Size) {
      Cache& c = cache();
      if (Node* node = c.head) {
        c.head = node->next;
        --c.count;
        return node;
      }
    }
#endif
    return ::operator new(size, std::nothrow);
  }

  static void release(void* block, std::size_t size) noexcept {
    if (!block) return;
#if LODESTACK_NODE_POOL
    if (size == Size) {
      Cache& c = cache();
      if (c.count < kLimit) {
        Node* node = static_cast<Node*>(block);
        node->next = c.head;
        c.head = node;
        ++c.count;
        return;
      }
    }
#else
    (void)size;
#endif
    ::operator delete(block);
  }

 private:
  static_assert(Size >= sizeof(void*), "a block must hold the list link");
  static const unsigned int kLimit = 4096;

  struct Node {
    Node* next;
  };
  // Trivially destructible, so that reaching it costs no guard; the
  // thread-exit hook is registered with the first block the thread keeps.
  struct Cache {
    Node* head;
    unsigned int count;
    bool hooked;
  };

  static Cache& cache() {
    static thread_local Cache c __attribute__((tls_model("initial-exec"))) = {nullptr, 0, false};
    if (__builtin_expect(!c.hooked, 0)) hook(c);
    return c;
  }

  static void hook(Cache& c) {
    static pthread_key_t key;
    static const int created = pthread_key_create(&key, &drain);
    c.hooked = true;
    if (created == 0) pthread_setspecific(key, &c);
  }

  static void drain(void* cache) {
    Cache& c = *static_cast<Cache*>(cache);
    while (c.head) {
      Node* next = c.head->next;
      ::operator delete(c.head);
      c.head = next;
    }
    c.count = 0;
  }
};

}  // namespace gom
}  // namespace lodestack

#endif  // LODESTACK_SRC_GOM_NODEPOOL_H
