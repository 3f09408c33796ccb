// The peer of the round-trip benchmarks: a plain two-thread ping-pong of 100 bytes through a
// mutex and a condition variable. The caller hands the bytes to an echo thread and waits for the
// answer, as a node waits for a reply.
#ifndef TARN_BENCH_MUTEXPINGPONG_H_
#define TARN_BENCH_MUTEXPINGPONG_H_

#include <condition_variable>
#include <cstring>
#include <mutex>
#include <thread>

namespace bench {

constexpr unsigned kPayload = 100;

class MutexPingPong {
public:
    MutexPingPong() : echo_([this] { Echo(); }) {}
    ~MutexPingPong() {
        {
            std::lock_guard<std::mutex> hold(mutex_);
            quit_ = true;
        }
        toEcho_.notify_one();
        echo_.join();
    }

    void RoundTrip(const char* request, char* reply) {
        std::unique_lock<std::mutex> hold(mutex_);
        std::memcpy(buffer_, request, kPayload);
        pending_ = true;
        toEcho_.notify_one();
        toCaller_.wait(hold, [this] { return !pending_; });
        std::memcpy(reply, buffer_, kPayload);
    }

private:
    void Echo() {
        std::unique_lock<std::mutex> hold(mutex_);
        for (;;) {
            toEcho_.wait(hold, [this] { return pending_ || quit_; });
            if (quit_) return;
            char request[kPayload];
            std::memcpy(request, buffer_, kPayload);
            std::memset(buffer_, request[0] + 1, kPayload);
            pending_ = false;
            toCaller_.notify_one();
        }
    }

    std::mutex mutex_;
    std::condition_variable toEcho_;
    std::condition_variable toCaller_;
    bool pending_ = false;
    bool quit_ = false;
    char buffer_[kPayload] = {};
    std::thread echo_;  // last: starts once the rest is ready
};

}  // namespace bench

#endif  // TARN_BENCH_MUTEXPINGPONG_H_
