// What a page can ask for, and how its questions reach the device.
#pragma once

#include "panel/hub.h"
#include "panel/server.h"
#include "panel/session.h"

#include <atomic>

struct page_file {
    std::string_view path; // "/" for the page itself
    std::string_view type;
    std::string_view text;
};

std::span<const page_file> page_files(); // made at build time from page/

struct panel {
    session device;
    hub questions;
    panel_server server;
    std::string token;
    std::string trace_path;
    std::vector<std::string> scenarios; // that can be played
    std::atomic<bool> stop = false;
    std::atomic<int> streams = 0; // of events
};

// Before the server listens.
void add_routes(panel &p);
