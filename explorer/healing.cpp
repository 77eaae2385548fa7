#include "healing.h"

namespace
{
std::string nv_and_clock()
{
    std::string key(reinterpret_cast<const char *>(world.texts.data()), world.texts.size());
    key += static_cast<char>(world.hour);
    return key;
}

// Both timers of twenty seconds; it is the device's longest period.
void pass_twenty_seconds()
{
    fire_timer_of(timer_purpose::TEMPERATURE);
    fire_timer_of(timer_purpose::NIGHT);
}

// What a device shows that has never been anything but switched on: NV and the clock alone have made it.
const led_picture &fresh_picture(power_cycles &cycles)
{
    static snapshot used;
    const auto [known, is_new] = cycles.fresh.try_emplace(nv_and_clock());
    if (is_new) {
        take_snapshot(used);
        world.leds = {};
        restart_and_switch_on(cycles);
        known->second = world.leds;
        put_back(used);
    }
    return known->second;
}
} // namespace

std::string text_of(const power_cycle &cycle, bool after_failures)
{
    return (after_failures ? "repair all\n" : "") + cycle.off.text + cycle.on.text + "after 20s\n";
}

void open_power_cycles(power_cycles &cycles, unsigned product)
{
    const bool has_switch = product != DATA_CARD && product != PAPER_KITE;
    const std::string on = has_switch ? "notify MAIN POWERON\n" : "";
    cycles.product = product;
    cycles.ways = {
        {stimulus_of("kill\n"), stimulus_of("start\n" + on), true}
    };
    if (has_switch) {
        cycles.ways.push_back({stimulus_of("notify SLEEP 0\nnotify MAIN SHUTTING_DOWN\n"), stimulus_of(on), false});
    }
    open_store(cycles.switched_off);
}

void switch_off(const power_cycles &cycles, const power_cycle &cycle)
{
    world.refused = 0;
    apply(cycle.off, cycles.product);
}

std::vector<breach> switch_on(power_cycles &cycles, const power_cycle &cycle)
{
    std::vector<breach> unhealed;
    apply(cycle.on, cycles.product);
    pass_twenty_seconds();
    const led_picture &due = fresh_picture(cycles);
    for (size_t at = 0; at < due.size(); at++) {
        const int led = static_cast<int>(at);
        if (world.leds[at] != due[at] && !is_told_by_notification(cycles.product, led)) {
            unhealed.push_back(
                {.broken = HEALING, .led = led, .shown = world.leds[at], .due = due[at], .restarted = cycle.restarts});
        }
    }
    return unhealed;
}

void restart_and_switch_on(const power_cycles &cycles)
{
    switch_off(cycles, cycles.ways.front());
    apply(cycles.ways.front().on, cycles.product);
    pass_twenty_seconds();
}
