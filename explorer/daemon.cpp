#include "daemon.h"

#include "core/dispatch.h"
#include "core/start.h"
#include "ground/led_ctx.h"
#include "language/messages.h"

#include <cstdlib>
#include <cstring>

// The bounds of the section in which seal-daemon has laid the daemon's statics.
extern "C" {
extern std::byte led_state_begin[];
extern std::byte led_state_end[];
}

// Copying passes the gaps that a sanitizer keeps between variables.
#define ALL_BYTES __attribute__((no_sanitize("address", "undefined", "thread"), noinline))

ALL_BYTES static void copy_bytes(std::byte *to, const std::byte *from, size_t size)
{
    size_t at = 0;
    for (; at + sizeof(uint64_t) <= size; at += sizeof(uint64_t)) {
        uint64_t word;
        __builtin_memcpy(&word, from + at, sizeof word);
        __builtin_memcpy(to + at, &word, sizeof word);
    }
    for (; at < size; at++) {
        to[at] = from[at];
    }
}

static size_t daemon_size()
{
    return static_cast<size_t>(led_state_end - led_state_begin);
}

ALL_BYTES bool daemon_holds(int word)
{
    for (size_t at = 0; at + sizeof word <= daemon_size(); at += alignof(int)) {
        int found;
        __builtin_memcpy(&found, led_state_begin + at, sizeof found);
        if (found == word) {
            return true;
        }
    }
    return false;
}

size_t snapshot_size()
{
    return sizeof world + daemon_size();
}

void take_snapshot(snapshot &into)
{
    memcpy(into.bytes.data(), &world, sizeof world);
    copy_bytes(into.bytes.data() + sizeof world, led_state_begin, daemon_size());
}

void put_back(const snapshot &from)
{
    memcpy(&world, from.bytes.data(), sizeof world);
    copy_bytes(led_state_begin, from.bytes.data() + sizeof world, daemon_size());
    happened = {};
}

// As the loader has left the statics: the first call comes before the daemon has run.
static const std::array<std::byte, SNAPSHOT_MAX> &pristine()
{
    static const std::array<std::byte, SNAPSHOT_MAX> image = [] {
        std::array<std::byte, SNAPSHOT_MAX> bytes = {};
        if (snapshot_size() > SNAPSHOT_MAX) {
            abort();
        }
        copy_bytes(bytes.data(), led_state_begin, daemon_size());
        return bytes;
    }();
    return image;
}

void cold_daemon()
{
    copy_bytes(led_state_begin, pristine().data(), daemon_size());
    world.timers = {};
}

void start_daemon()
{
    if (kiv_led_start() != 0) {
        abort(); // no thread can fail to start here
    }
    deliver_relights();
}

void kill_daemon()
{
    cold_daemon();
    world.power = POWER_NOT_YET;
    world.asleep = 0;
    world.call_up = 0;
    world.restarting = 0;
    drop_excuse(~EXCUSES_OF_LEDS);
}

received received_of(const std::string &bytes)
{
    received message = {};
    memcpy(&message.message, bytes.data(), std::min(bytes.size(), sizeof message.message));
    return message;
}

void deliver_relights()
{
    static const received relight = received_of(command(KIV_MSG_CMD_LED_RELIGHT_MSG));
    while (happened.relights > 0) {
        happened.relights--;
        excuse_by(world.asleep != 0 ? RELIT_ASLEEP : 0);
        messageParse(&relight.message);
    }
}

void deliver(const received &message)
{
    messageParse(&message.message);
    deliver_relights();
}

void indicate(int event_id)
{
    int record = 0;
    if (board_callback != nullptr) {
        board_callback(event_id, 0, &record);
        deliver_relights();
    }
}
