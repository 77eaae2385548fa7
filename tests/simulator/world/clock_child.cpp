// Does everything that the clock stands in front of, and says in which order and when.
#include <array>
#include <atomic>
#include <cerrno>
#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <functional>
#include <mutex>
#include <poll.h>
#include <pthread.h>
#include <semaphore.h>
#include <shared_mutex>
#include <string>
#include <sys/epoll.h>
#include <sys/select.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/timerfd.h>
#include <thread>
#include <time.h>
#include <unistd.h>

namespace
{
std::array<int, 2> sockets;
pthread_mutex_t mutex = PTHREAD_MUTEX_INITIALIZER;
pthread_cond_t on_monotonic_clock;
pthread_cond_t on_wall_clock = PTHREAD_COND_INITIALIZER;
int unguarded;

void say(const std::string &what)
{
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    printf("%lld.%03ld t%lu %s\n", static_cast<long long>(now.tv_sec), now.tv_nsec / 1'000'000,
           static_cast<unsigned long>(pthread_self()), what.c_str());
    fflush(stdout);
}

void touch_unguarded()
{
    if (getenv("CLOCK_CHILD_RACES")) {
        unguarded++;
    }
}

void *receive(void *)
{
    std::array<char, 32> text;
    for (;;) {
        const ssize_t length = recv(sockets[0], text.data(), text.size() - 1, 0);
        text[static_cast<size_t>(length)] = '\0';
        touch_unguarded();
        say(std::string("received ") + text.data());
        usleep(50'000);
    }
}

void *tick(void *)
{
    timespec next = {};
    pthread_mutex_lock(&mutex);
    clock_gettime(CLOCK_MONOTONIC, &next);
    for (int count = 1;; count++) {
        next.tv_sec += 20;
        while (pthread_cond_timedwait(&on_monotonic_clock, &mutex, &next) == 0) {
            say("signalled");
        }
        touch_unguarded();
        if (count <= 2 || count == 2000 || count == 4320) {
            say("tick " + std::to_string(count));
        }
    }
}

void *wait_for_noon(void *)
{
    timespec noon = {};
    pthread_mutex_lock(&mutex);
    noon.tv_sec = 43'200;
    pthread_cond_timedwait(&on_wall_clock, &mutex, &noon);
    pthread_mutex_unlock(&mutex);
    say("noon at " + std::to_string(time(nullptr)));
    return &mutex;
}

void use_library_threads()
{
    std::mutex guard;
    std::condition_variable changed;
    bool done = false;
    std::thread worker([&] {
        std::this_thread::sleep_for(std::chrono::seconds(2));
        const std::lock_guard lock(guard);
        done = true;
        changed.notify_one();
    });
    std::unique_lock lock(guard);
    say(changed.wait_for(lock, std::chrono::seconds(1), [&] { return done; }) ? "early" : "not yet");
    changed.wait(lock, [&] { return done; });
    lock.unlock();
    worker.join();
    say("worker done");
}

// Whoever waits longest goes first, at the condition and at the mutex behind it.
void wake_all_at_once()
{
    std::mutex guard;
    std::condition_variable changed;
    bool open = false;
    const auto wait = [&] {
        std::unique_lock lock(guard);
        changed.wait(lock, [&] { return open; });
        say("through");
    };
    std::thread first(wait);
    std::thread second(wait);
    std::thread third(wait);
    usleep(1000);
    {
        const std::lock_guard lock(guard);
        open = true;
        changed.notify_all();
    }
    third.join();
    second.join();
    first.join();
}

void wait_on_descriptors()
{
    pollfd nothing = {sockets[1], POLLIN, 0};
    epoll_event event = {};
    const int poller = epoll_create1(0);
    say("poll " + std::to_string(poll(&nothing, 1, 250)));
    say("epoll " + std::to_string(epoll_wait(poller, &event, 1, 750)));
    close(poller);
}

#define LED "/sys/class/leds/led:test/brightness"

void look_at_kernel_files()
{
    struct stat info = {};
    FILE *file = fopen(LED, "re");
    say("fopen " + std::string(file ? "found" : "missing"));
    if (file) {
        fclose(file);
    }
    say("access " + std::to_string(access(LED, R_OK)) + ", stat " + std::to_string(stat(LED, &info)));
    close(open64(LED, O_RDONLY));
    const int status =
        system("cat " LED "; cat \"" LED "\" '" LED "'; echo 'a \"'/tmp" LED "; echo preload=$LD_PRELOAD");
    say("shell " + std::to_string(status));
}

// One thread holds it for a second; the other comes to the same place meanwhile.
void meet(const char *where, const std::function<void()> &hold, const std::function<void()> &come)
{
    std::thread holder(hold);
    usleep(1000);
    come();
    say(std::string("past ") + where);
    holder.join();
}

#if defined(__SANITIZE_THREAD__)
// Its runtime waits for a static where no clock sees it.
void slow_value()
{
    static std::once_flag once;
    std::call_once(once, [] { sleep(1); });
}
#else
void slow_value()
{
    [[maybe_unused]] static const unsigned rest = sleep(1);
}
#endif

void use_shared_things()
{
    std::shared_mutex shared;
    std::once_flag once;
    std::atomic<int> word = 0;
    const auto slow = [] { sleep(1); };
    meet(
        "a shared lock",
        [&] {
            const std::unique_lock lock(shared);
            sleep(1);
        },
        [&] { const std::shared_lock lock(shared); });
    meet(
        "call_once", [&] { std::call_once(once, slow); }, [&] { std::call_once(once, slow); });
    meet(
        "a static", [] { slow_value(); }, [] { slow_value(); });
    meet(
        "an atomic",
        [&] {
            sleep(1);
            word = 1;
            word.notify_all();
        },
        [&] { word.wait(0); });
}

void use_descriptors_that_block()
{
    std::array<int, 2> ends;
    std::array<char, 8> text;
    fd_set waiting;
    timeval limit = {.tv_sec = 1, .tv_usec = 0};
    if (pipe(ends.data()) != 0) {
        return;
    }
    meet(
        "a pipe",
        [&] {
            sleep(1);
            say("wrote " + std::to_string(write(ends[1], "x", 1)));
        },
        [&] { say("read " + std::to_string(read(ends[0], text.data(), text.size()))); });
    FD_ZERO(&waiting);
    FD_SET(ends[0], &waiting);
    say("select " + std::to_string(select(ends[0] + 1, &waiting, nullptr, nullptr, &limit)));
    setsockopt(sockets[1], SOL_SOCKET, SO_RCVTIMEO, &limit, sizeof limit);
    say("recv " + std::to_string(recv(sockets[1], text.data(), text.size(), 0)));
}

void lock_twice()
{
    pthread_mutexattr_t kind;
    pthread_mutex_t checked;
    timespec now = {};
    pthread_mutexattr_init(&kind);
    pthread_mutexattr_settype(&kind, PTHREAD_MUTEX_ERRORCHECK);
    pthread_mutex_init(&checked, &kind);
    pthread_mutex_lock(&checked);
    say(pthread_mutex_lock(&checked) == EDEADLK ? "deadlock" : "locked twice");
    timespec_get(&now, TIME_UTC);
    say("wall clock " + std::to_string(now.tv_sec));
}
} // namespace

int main()
{
    pthread_condattr_t monotonic;
    std::array<pthread_t, 3> ids;
    sem_t never;
    void *result = nullptr;
    pthread_condattr_init(&monotonic);
    pthread_condattr_setclock(&monotonic, CLOCK_MONOTONIC);
    pthread_cond_init(&on_monotonic_clock, &monotonic);
    if (socketpair(AF_UNIX, SOCK_DGRAM, 0, sockets.data()) != 0) {
        return 1;
    }
    pthread_create(&ids[0], nullptr, receive, nullptr);
    pthread_create(&ids[1], nullptr, tick, nullptr);
    pthread_create(&ids[2], nullptr, wait_for_noon, nullptr);
    say("started");
    send(sockets[1], "one", 3, 0);
    send(sockets[1], "two", 3, 0);
    usleep(1000);
    pthread_mutex_lock(&mutex);
    pthread_cond_signal(&on_monotonic_clock);
    pthread_mutex_unlock(&mutex);
    wait_on_descriptors();
    use_library_threads();
    pthread_join(ids[2], &result);
    say(result == &mutex ? "joined" : "not joined");
    look_at_kernel_files();
    wake_all_at_once();
    use_shared_things();
    use_descriptors_that_block();
    lock_twice();
    if (getenv("CLOCK_CHILD_TIMERFD")) {
        timerfd_create(CLOCK_MONOTONIC, 0);
    }
    sem_init(&never, 0, 0);
    sem_wait(&never);
}
