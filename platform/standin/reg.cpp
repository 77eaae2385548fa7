#include "kiv/reg.h"

#include "kiv/socket.h"
#include "standin.h"
#include "trace/calls.h"

#include <array>
#include <cstdio>
#include <cstring>
#include <dirent.h>
#include <fcntl.h>
#include <mutex>
#include <unistd.h>

struct registration {
    int module_id; // 0: a free row
    std::array<uint32_t, 4> masks;
};

// A registration request as it crosses the bus.
struct reg_request {
    uint16_t us_cmd;
    uint16_t us_reserved1;
    uint16_t us_dest_module_id;
    uint16_t us_source_module_id;
    uint16_t us_data_len;
    uint16_t us_reserved2;
    reg_masks masks;
};
static_assert(sizeof(reg_request) == 28, "reg_request crosses the bus");

static std::mutex table_lock;
static bool table_ready;
static std::array<registration, 64> table;

static bool is_module_id(int module_id)
{
    return module_id > 0 && module_id <= UINT16_MAX;
}

// The folder shows this process's table, which starts empty.
static void clear_folder()
{
    const int fd = openat(standin_device_dir(), "reg", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    DIR *folder = fd < 0 ? nullptr : fdopendir(fd);
    if (folder == nullptr) {
        return;
    }
    for (const dirent *entry = readdir(folder); entry != nullptr; entry = readdir(folder)) {
        if (standin_is_plain_name(entry->d_name)) {
            unlinkat(fd, entry->d_name, 0);
        }
    }
    closedir(folder);
}

// The table belongs to whoever owns the module's queue: a second instance must not empty the first one's.
static bool own_module(int module_id)
{
    char file[64];
    const char *queue_name = standin_module_queue(module_id);
    if (queue_name != nullptr) {
        snprintf(file, sizeof file, "bus/%s", queue_name);
    } else {
        snprintf(file, sizeof file, "bus/module-%d", module_id);
    }
    return standin_own(file);
}

static int init_table(int module_id)
{
    if (!is_module_id(module_id) || !own_module(module_id)) {
        return -1;
    }
    const std::lock_guard guard(table_lock);
    clear_folder();
    table = {};
    table_ready = true;
    return 0;
}

static registration *find_row(int module_id)
{
    for (registration &row : table) {
        if (row.module_id == module_id || row.module_id == 0) {
            return &row;
        }
    }
    return nullptr;
}

static int record_request(int source_module_id, const uint32_t *masks)
{
    char name[16];
    char text[64];
    if (!is_module_id(source_module_id) || masks == nullptr) {
        return 0;
    }
    const std::lock_guard guard(table_lock);
    registration *row = table_ready ? find_row(source_module_id) : nullptr;
    if (row == nullptr) {
        return 0;
    }
    snprintf(name, sizeof name, "%d", source_module_id);
    const int length = snprintf(text, sizeof text, "0x%x 0x%x 0x%x 0x%x", masks[0], masks[1], masks[2], masks[3]);
    if (standin_write_text("reg", name, text, length) != 0) {
        return 0;
    }
    row->module_id = source_module_id;
    memcpy(row->masks.data(), masks, sizeof row->masks);
    return 1;
}

static int send_request(int source_module_id, int dest_module_id, const reg_masks *masks)
{
    const char *queue_name = standin_module_queue(source_module_id);
    if (queue_name == nullptr || !is_module_id(dest_module_id) || masks == nullptr) {
        return -1;
    }
    const reg_request request = {
        .us_cmd = MSG_CMD_SERVICE_REG,
        .us_reserved1 = 0,
        .us_dest_module_id = static_cast<uint16_t>(source_module_id),
        .us_source_module_id = static_cast<uint16_t>(dest_module_id),
        .us_data_len = sizeof request.masks,
        .us_reserved2 = 0,
        .masks = *masks,
    };
    return standin_send(queue_name, &request, sizeof request, STANDIN_SEND_WAIT_MS) == 0 ? 0 : -1;
}

int kiv_reg_table_init(int module_id)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_int(line, module_id); }, [&] { return init_table(module_id); });
}

int kiv_reg_proc(int source_module_id, const uint32_t *masks)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_reg_proc(line, source_module_id, masks); },
        [&] { return record_request(source_module_id, masks); });
}

int kiv_reg_func(int source_module_id, int dest_module_id, const reg_masks *masks)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_reg_func(line, source_module_id, dest_module_id, masks); },
        [&] { return send_request(source_module_id, dest_module_id, masks); });
}
