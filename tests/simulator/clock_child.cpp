// Does everything that the clock stands in front of, and says in which order and when.
#include <array>
#include <chrono>
#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <mutex>
#include <poll.h>
#include <pthread.h>
#include <semaphore.h>
#include <string>
#include <sys/epoll.h>
#include <sys/socket.h>
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
    if (getenv("CLOCK_CHILD_RACES"))
        unguarded++;
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
        while (pthread_cond_timedwait(&on_monotonic_clock, &mutex, &next) == 0)
            say("signalled");
        touch_unguarded();
        if (count <= 2 || count == 2000 || count == 4320)
            say("tick " + std::to_string(count));
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
    if (socketpair(AF_UNIX, SOCK_DGRAM, 0, sockets.data()) != 0)
        return 1;
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
    const int status = system("cat /sys/class/leds/led:test/brightness; echo preload=$LD_PRELOAD");
    say("shell " + std::to_string(status));
    wake_all_at_once();
    sem_init(&never, 0, 0);
    sem_wait(&never);
}
