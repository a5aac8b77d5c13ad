#include "lodestack/core/Lockable.h"

namespace lodestack {

LockableBase::LockableBase()
    : mutex_(core::IMutex::create(std::wstring(), false, true)), depth_(0) {}

LockableBase::~LockableBase() = default;

bool LockableBase::lock() {
  if (!mutex_ || !mutex_->lock()) return false;
  ++depth_;
  return true;
}

int LockableBase::tryLock(unsigned int ms) {
  if (!mutex_) return 0;
  const int result = mutex_->tryLock(ms);
  if (result == 1) ++depth_;
  return result;
}

void LockableBase::unlock() {
  if (depth_ < 1 || !mutex_) return;
  --depth_;
  mutex_->unlock();
}

}  // namespace lodestack
