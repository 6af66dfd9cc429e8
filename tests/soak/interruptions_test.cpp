// SPDX-License-Identifier: Apache-2.0
// What the rest of a process does to a thread inside a call: fork, signals, cancellation.
#include <gtest/gtest.h>
#include <ovrinresize.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <chrono>
#include <csignal>
#include <functional>
#include <iostream>
#include <thread>

#include "soak/calls.h"
#include "support/instrumented.h"
#include "support/random.h"

using namespace ovrin_test;

namespace {

// Calls and what they gave when nothing interrupted them.
class Known {
public:
    explicit Known(std::vector<Call> calls) : calls_(std::move(calls)) {
        for (const Call& call : calls_) pictures_.push_back(call.run());
    }

    size_t count() const { return calls_.size(); }

    bool come_out_right() const {
        for (size_t i = 0; i < calls_.size(); ++i) {
            if (calls_[i].run() != pictures_[i]) return false;
        }
        return true;
    }

private:
    std::vector<Call> calls_;
    std::vector<Bytes> pictures_;
};

void count_up(void* counter) {
    static_cast<std::atomic<int>*>(counter)->fetch_add(1);
}

// With more tasks than slots, so that submitting one waits.
bool pool_works() {
    constexpr int kTasks = OVRIN_THREADPOOL_CAPACITY + 100;
    std::atomic<int> runs{0};
    ovrin_threadpool* pool = ovrin_threadpool_init(2);
    if (pool == nullptr) return false;
    int submitted = 0;
    for (int i = 0; i < kTasks; ++i)
        submitted += ovrin_threadpool_add_task(pool, count_up, &runs, 1);
    ovrin_threadpool_free(pool, 1);
    return submitted == kTasks && runs == kTasks;
}

}  // namespace

// ---- fork -------------------------------------------------------------------------------------

namespace {

// Threads that are inside calls nearly all the time.
class Callers {
public:
    Callers(int count, const Known& calls) {
        for (int i = 0; i < count; ++i) {
            threads_.emplace_back([&] {
                do {
                    if (!calls.come_out_right() || !pool_works()) ++wrong_;
                } while (!stop_);
            });
        }
    }
    ~Callers() {
        stop_ = true;
        for (std::thread& thread : threads_) thread.join();
        EXPECT_EQ(wrong_, 0);
    }

    Callers(const Callers&) = delete;
    Callers& operator=(const Callers&) = delete;

private:
    std::vector<std::thread> threads_;
    std::atomic<bool> stop_{false};
    std::atomic<int> wrong_{0};
};

constexpr bool kChildHasThreads = !kInstrumented && !kEmulated;
constexpr const char* kWhyNot =
    "a child of fork with threads hangs or ends in the sanitizers' libraries and in qemu-user";

// What waitpid says of a child that makes all these calls; it has only the thread that called fork.
int status_of_child(const Known& threaded, const Known& alone) {
    const pid_t child = fork();
    if (child == 0) {
        alarm(120);
        const bool right = threaded.come_out_right() && alone.come_out_right() && pool_works();
        _exit(right ? 0 : 1);
    }
    int status = -1;
    while (waitpid(child, &status, 0) < 0 && errno == EINTR) {
    }
    return status;
}

}  // namespace

TEST(Interruptions, AChildOfForkGetsTheSameBytesWhileOtherThreadsAreInsideCalls) {
    if (!kChildHasThreads) GTEST_SKIP() << kWhyNot;
    const Known threaded(threaded_calls()), alone(calling_thread_calls());
    const int children = repetitions(rounds(40), 1000);
    const Callers callers(3, threaded);
    for (int i = 0; i < children; ++i)
        ASSERT_EQ(status_of_child(threaded, alone), 0) << "child " << i;
    std::cout << children << " children\n";
}

TEST(Interruptions, AWorkerOfAPoolMayFork) {
    if (!kChildHasThreads) GTEST_SKIP() << kWhyNot;
    struct Task {
        Known threaded{threaded_calls()}, alone{calling_thread_calls()};
        int status = -1;
        static void run(void* self) {
            auto* task = static_cast<Task*>(self);
            task->status = status_of_child(task->threaded, task->alone);
        }
    };
    Task task;
    ovrin_threadpool* pool = ovrin_threadpool_init(2);
    ASSERT_EQ(ovrin_threadpool_add_task(pool, Task::run, &task, 0), 1);
    ovrin_threadpool_free(pool, 1);
    EXPECT_EQ(task.status, 0);
}

// ---- signals ----------------------------------------------------------------------------------

namespace {

constexpr int kToThreads = SIGUSR1, kToProcess = SIGUSR2, kFromTimer = SIGALRM;
constexpr int kSignals[] = {kToThreads, kToProcess, kFromTimer};

std::atomic<int64_t> handled{0}, handled_by_workers{0};
thread_local bool is_worker = true;  // of the library's, as all threads of the test say otherwise

void handle(int /*signal*/) {
    handled.fetch_add(1, std::memory_order_relaxed);
    if (is_worker) handled_by_workers.fetch_add(1, std::memory_order_relaxed);
}

void set_mask(int how) {
    sigset_t signals;
    sigemptyset(&signals);
    for (const int signal : kSignals) sigaddset(&signals, signal);
    ASSERT_EQ(pthread_sigmask(how, &signals, nullptr), 0);
}

void set_timer(int microseconds) {
    const itimerval every = {{0, microseconds}, {0, microseconds}};
    ASSERT_EQ(setitimer(ITIMER_REAL, &every, nullptr), 0);
}

// While it lives, the signals interrupt what they meet: no SA_RESTART. The thread that made it gets
// none.
class Handlers {
public:
    Handlers() {
        is_worker = false;
        set_mask(SIG_BLOCK);
        struct sigaction action = {};
        action.sa_handler = handle;
        for (size_t i = 0; i < std::size(kSignals); ++i)
            sigaction(kSignals[i], &action, &before_[i]);
        set_timer(300);
    }
    ~Handlers() {
        set_timer(0);
        set_mask(SIG_UNBLOCK);  // what is pending still finds its handler
        for (size_t i = 0; i < std::size(kSignals); ++i)
            sigaction(kSignals[i], &before_[i], nullptr);
    }

    Handlers(const Handlers&) = delete;
    Handlers& operator=(const Handlers&) = delete;

private:
    struct sigaction before_[std::size(kSignals)];
};

}  // namespace

TEST(Interruptions, SignalsChangeNothing) {
    constexpr int kCallers = 2;
    const Known calls(threaded_calls());
    const int turns = repetitions(rounds(100), 5000);
    const Handlers handlers;
    std::atomic<int> wrong{0}, made{0}, finished{0};
    const auto start = std::chrono::steady_clock::now();
    std::vector<std::thread> callers;
    for (int i = 0; i < kCallers; ++i) {
        callers.emplace_back([&] {
            is_worker = false;
            set_mask(SIG_UNBLOCK);
            // On a busy machine a worker may be late to meet a signal.
            for (int turn = 0; turn < turns || (handled_by_workers == 0 && turn < 100 * turns);
                 ++turn) {
                if (!calls.come_out_right() || !pool_works()) ++wrong;
                ++made;
            }
            ++finished;
        });
    }
    while (finished < kCallers) {
        for (std::thread& caller : callers) pthread_kill(caller.native_handle(), kToThreads);
        kill(getpid(), kToProcess);
        usleep(20);
    }
    for (std::thread& caller : callers) caller.join();
    const std::chrono::duration<double> seconds = std::chrono::steady_clock::now() - start;
    EXPECT_EQ(wrong, 0);
    EXPECT_GT(handled_by_workers, 0);
    std::cout << made * static_cast<int>(calls.count()) << " calls, " << handled << " signals, "
              << handled_by_workers << " of them handled by workers, "
              << static_cast<int64_t>(static_cast<double>(handled) / seconds.count())
              << " a second\n";
}

// ---- cancellation -----------------------------------------------------------------------------

namespace {

// A thread that makes calls and can then be cancelled.
struct Cancelled {
    const Known& calls;
    int state;  // of cancellation, during the calls
    bool cancels_itself;
    bool right = false;

    static void* run(void* self) {
        auto* thread = static_cast<Cancelled*>(self);
        pthread_setcancelstate(thread->state, nullptr);
        if (thread->cancels_itself) pthread_cancel(pthread_self());
        thread->right = thread->calls.come_out_right();
        pthread_setcancelstate(PTHREAD_CANCEL_ENABLE, nullptr);
        while (true) {
            pthread_testcancel();
            sched_yield();
        }
    }
};

}  // namespace

TEST(Interruptions, CancellationWaitsForThreadedCallsWhereItIsDisabled) {
    const Known calls(threaded_calls());
    Random random(163);
    for (int i = 0; i < repetitions(rounds(100), 10000); ++i) {
        Cancelled cancelled{calls, PTHREAD_CANCEL_DISABLE, false};
        pthread_t thread;
        ASSERT_EQ(pthread_create(&thread, nullptr, Cancelled::run, &cancelled), 0);
        usleep(static_cast<useconds_t>(random.between(0, 2000)));
        ASSERT_EQ(pthread_cancel(thread), 0);
        void* result = nullptr;
        ASSERT_EQ(pthread_join(thread, &result), 0);
        EXPECT_EQ(result, PTHREAD_CANCELED);
        ASSERT_TRUE(cancelled.right);
    }
}

TEST(Interruptions, CallsOnTheCallingThreadAreNoCancellationPoints) {
    const Known calls(calling_thread_calls());
    Cancelled cancelled{calls, PTHREAD_CANCEL_ENABLE, true};
    pthread_t thread;
    ASSERT_EQ(pthread_create(&thread, nullptr, Cancelled::run, &cancelled), 0);
    void* result = nullptr;
    ASSERT_EQ(pthread_join(thread, &result), 0);
    EXPECT_EQ(result, PTHREAD_CANCELED);
    EXPECT_TRUE(cancelled.right);
}
