// Mutual exclusion that needs no initialisation call and holds no system resource (SRW locks on
// Windows, pthread elsewhere). Both classes satisfy the standard Lockable requirements, so
// std::lock_guard and std::unique_lock fit.
#pragma once

#include <memory>
#include <mutex>

namespace zq::platform {

class Mutex {
  public:
    Mutex();
    ~Mutex();
    Mutex(const Mutex&) = delete;
    Mutex& operator=(const Mutex&) = delete;
    void lock();
    void unlock();
    bool try_lock();

  private:
    friend class Condition;
    alignas(8) unsigned char storage_[64];
};

class Condition {
  public:
    Condition();
    ~Condition();
    Condition(const Condition&) = delete;
    Condition& operator=(const Condition&) = delete;
    // The mutex is held on entry and on return; wake-ups may be spurious.
    void wait(Mutex& mutex);
    void notify_one();
    void notify_all();

  private:
    alignas(8) unsigned char storage_[64];
};

}  // namespace zq::platform
