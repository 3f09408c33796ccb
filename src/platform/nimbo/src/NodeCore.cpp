#include "NodeCore.h"

#include <exception>
#include <system_error>

#include "ContextImpl.h"
#include "LauncherState.h"
#include "Nimbo/Channel.h"
#include "Nimbo/Node.h"
#include "Nimbo/PrivateServices.h"
#include "Nimbo/ResultCodes.h"

namespace Nimbo {
namespace {

// The node whose delivery thread this is, if any. SendBinaryAndWait delivers inline when it is
// the target, and Stop does not try to join its own thread.
thread_local const NodeCore* tl_delivering = nullptr;

std::atomic<std::uint64_t> g_lastSerial{0};

inline void CpuRelax() {
#if defined(__x86_64__) || defined(__i386__)
    __builtin_ia32_pause();
#endif
}

// Polls `ready` for about `spin`, giving the processor away now and then, so that a message that
// arrives soon is taken without the cost of sleeping and being woken.
template <typename Ready>
void Spin(std::chrono::microseconds spin, Ready ready) {
    if (spin.count() <= 0) return;
    const auto deadline = std::chrono::steady_clock::now() + spin;
    for (unsigned round = 1;; ++round) {
        if (ready()) return;
        if (round % 64 == 0) {
            if (std::chrono::steady_clock::now() >= deadline) return;
            std::this_thread::yield();
        } else {
            CpuRelax();
        }
    }
}

}  // namespace

void Completion::Complete(long result) {
    std::lock_guard<std::mutex> hold(mutex_);
    result_ = result;
    done_.store(true, std::memory_order_release);
    if (sleeping_) wake_.notify_one();
}

long Completion::Wait() {
    Spin(spin_, [this] { return done_.load(std::memory_order_acquire); });
    std::unique_lock<std::mutex> hold(mutex_);
    while (!done_.load(std::memory_order_relaxed)) {
        sleeping_ = true;
        wake_.wait(hold);
    }
    return result_;
}

NodeCore::NodeCore(Node& node, const ZelUnicodeString& name, const NodeSettings& settings,
                   bool callback)
    : serial_(g_lastSerial.fetch_add(1, std::memory_order_relaxed) + 1),
      name_(name),
      callback_(callback),
      spin_(settings.GetSpinTime()),
      node_(node) {}

NodeCore::~NodeCore() {
    // The last owner may be the delivery thread itself, on its way out.
    if (thread_.joinable()) {
        if (thread_.get_id() == std::this_thread::get_id()) {
            thread_.detach();
        } else {
            thread_.join();
        }
    }
}

bool NodeCore::Launch(ContextImpl& context, std::shared_ptr<LauncherState> launcher) {
    {
        std::lock_guard<std::mutex> hold(mailMutex_);
        if (state_.load(std::memory_order_relaxed) != kIdle) return false;
        context_.store(&context, std::memory_order_release);
        launcher_ = std::move(launcher);
        state_.store(kRunning, std::memory_order_release);
    }
    std::shared_ptr<NodeCore> self = shared_from_this();
    context.Register(self);
    try {
        std::lock_guard<std::mutex> hold(joinMutex_);
        thread_ = std::thread(&NodeCore::Run, this, self);
        return true;
    } catch (const std::system_error&) {
    }
    // No thread: undo, dropping whatever was sent meanwhile.
    Halt();
    {
        std::lock_guard<std::mutex> hold(mailMutex_);
        state_.store(kIdle, std::memory_order_release);
        context_.store(nullptr, std::memory_order_release);
        launcher_.reset();
    }
    std::lock_guard<std::mutex> hold(linksMutex_);
    notices_.clear();
    subscribers_.clear();
    return false;
}

bool NodeCore::CanSendTo(const std::shared_ptr<NodeCore>& target) const {
    return IsRunning() && target != nullptr && target->GetContext() == GetContext();
}

long NodeCore::Send(const std::shared_ptr<NodeCore>& target, const Binary& message) {
    if (!CanSendTo(target)) return E_FAIL;
    return target->Enqueue(message, shared_from_this(), nullptr);
}

long NodeCore::SendAndWait(const std::shared_ptr<NodeCore>& target, const Binary& message) {
    if (!CanSendTo(target)) return E_FAIL;
    if (tl_delivering == target.get()) {
        // The target's own thread is the caller: queueing would wait for ourselves forever.
        if (!target->IsRunning()) return E_FAIL;
        ContextImpl* context = GetContext();
        context->BeginWork();
        const long result = target->Deliver(target, message, shared_from_this());
        context->EndWork();
        return result;
    }
    Completion done(spin_);
    const long queued = target->Enqueue(message, shared_from_this(), &done);
    if (queued < 0) return queued;
    return done.Wait();
}

long NodeCore::ArmNotice(const std::shared_ptr<NodeCore>& target, const Binary& message) {
    if (!CanSendTo(target) || !target->IsRunning()) return E_FAIL;
    std::lock_guard<std::mutex> hold(linksMutex_);
    // Checked again under the lock that Finish takes to collect the notices.
    if (!IsRunning()) return E_FAIL;
    notices_.emplace_back(target, message);
    return S_OK;
}

long NodeCore::Emit(const ZelUnicodeString& name, const Binary& message) {
    if (!IsRunning()) return E_FAIL;
    std::vector<std::shared_ptr<NodeCore>> targets;
    {
        std::lock_guard<std::mutex> hold(linksMutex_);
        auto found = subscribers_.find(name);
        if (found != subscribers_.end()) {
            auto& subscribers = found->second;
            for (auto it = subscribers.begin(); it != subscribers.end();) {
                std::shared_ptr<NodeCore> subscriber = it->lock();
                if (subscriber != nullptr && subscriber->IsRunning()) {
                    targets.push_back(std::move(subscriber));
                    ++it;
                } else {
                    it = subscribers.erase(it);  // stopped for good: never again a subscriber
                }
            }
        }
    }
    if (targets.empty()) return S_OK;
    std::shared_ptr<NodeCore> self = shared_from_this();
    for (const auto& target : targets) target->Enqueue(message, self, nullptr);
    return S_OK;
}

long NodeCore::SubscribeTo(const std::shared_ptr<NodeCore>& emitter, const ZelUnicodeString& name) {
    if (!CanSendTo(emitter)) return E_FAIL;
    return emitter->AddSubscriber(name, shared_from_this());
}

long NodeCore::AddSubscriber(const ZelUnicodeString& name,
                             const std::shared_ptr<NodeCore>& subscriber) {
    std::lock_guard<std::mutex> hold(linksMutex_);
    if (!IsRunning()) return E_FAIL;
    auto& subscribers = subscribers_[name];
    for (const auto& known : subscribers) {
        if (known.lock() == subscriber) return S_OK;
    }
    subscribers.push_back(subscriber);
    return S_OK;
}

long NodeCore::Enqueue(const Binary& message, std::shared_ptr<NodeCore> sender,
                       Completion* completion) {
    bool wake;
    {
        std::lock_guard<std::mutex> hold(mailMutex_);
        if (state_.load(std::memory_order_relaxed) != kRunning) return E_FAIL;
        queue_.push_back(Envelope{message, std::move(sender), completion});
        queued_.store(queue_.size(), std::memory_order_release);
        context_.load(std::memory_order_relaxed)->BeginWork();
        wake = sleeping_;
    }
    if (wake) mail_.notify_one();
    return S_OK;
}

bool NodeCore::Halt() {
    std::deque<Envelope> dropped;
    {
        std::lock_guard<std::mutex> hold(mailMutex_);
        const int state = state_.load(std::memory_order_relaxed);
        if (state != kRunning) {
            // A node stopped before its launch never runs.
            if (state == kIdle) state_.store(kStopped, std::memory_order_release);
            return false;
        }
        state_.store(kStopped, std::memory_order_release);
        dropped.swap(queue_);
        queued_.store(0, std::memory_order_relaxed);
    }
    mail_.notify_all();
    ContextImpl* context = GetContext();
    context->Unregister(*this);
    for (const Envelope& envelope : dropped) {
        if (envelope.completion != nullptr) envelope.completion->Complete(E_FAIL);
    }
    const std::size_t count = dropped.size();
    dropped.clear();
    for (std::size_t i = 0; i < count; ++i) context->EndWork();
    return true;
}

void NodeCore::Finish() {
    if (tl_delivering != this) {
        std::lock_guard<std::mutex> hold(joinMutex_);
        if (thread_.joinable()) thread_.join();
    }
    std::vector<std::pair<std::weak_ptr<NodeCore>, Binary>> notices;
    {
        std::lock_guard<std::mutex> hold(linksMutex_);
        notices.swap(notices_);
        subscribers_.clear();
    }
    if (!notices.empty()) {
        std::shared_ptr<NodeCore> self = shared_from_this();
        for (const auto& notice : notices) {
            if (std::shared_ptr<NodeCore> target = notice.first.lock()) {
                target->Enqueue(notice.second, self, nullptr);
            }
        }
    }
    if (!finished_.exchange(true, std::memory_order_acq_rel) && launcher_ != nullptr) {
        launcher_->NodeFinished();
    }
}

void NodeCore::Run(std::shared_ptr<NodeCore> self) {
    tl_delivering = this;
    ContextImpl* context = GetContext();
    for (;;) {
        Spin(spin_, [this] {
            return queued_.load(std::memory_order_acquire) != 0 ||
                   state_.load(std::memory_order_relaxed) != kRunning;
        });
        {
            Envelope envelope;
            {
                std::unique_lock<std::mutex> hold(mailMutex_);
                while (queue_.empty() && state_.load(std::memory_order_relaxed) == kRunning) {
                    sleeping_ = true;
                    mail_.wait(hold);
                    sleeping_ = false;
                }
                // Halt emptied the queue and accounted for what it dropped.
                if (state_.load(std::memory_order_relaxed) != kRunning) break;
                envelope = std::move(queue_.front());
                queue_.pop_front();
                queued_.store(queue_.size(), std::memory_order_relaxed);
            }
            const long result = Deliver(self, envelope.message, std::move(envelope.sender));
            if (envelope.completion != nullptr) envelope.completion->Complete(result);
        }
        context->EndWork();
    }
    tl_delivering = nullptr;
}

long NodeCore::Deliver(const std::shared_ptr<NodeCore>& self, const Binary& message,
                       std::shared_ptr<NodeCore> sender) {
    Channel channel(self, std::move(sender));
    ZelUnicodeString what;
    try {
        return node_.OnBinary(message, channel);
    } catch (const std::exception& error) {
        what = error.what();
    } catch (...) {
        what = "an unknown exception";
    }
    PrivateServices::PublishError(
        GetContext()->GetContext(),
        ZelUnicodeString("Nimbo::Node::OnBinary() of node <") + name_ + "> threw <" + what + ">",
        "Nimbo");
    return E_FAIL;
}

}  // namespace Nimbo
