#include "world/standstill.h"

#include <algorithm>
#include <array>
#include <filesystem>
#include <fstream>
#include <sys/syscall.h>
#include <vector>

namespace fs = std::filesystem;

namespace
{
struct call_row {
    long number;
    const char *name;
};

constexpr std::array call_rows = {
    call_row{SYS_futex,           "futex (a mutex, condition or semaphore)"},
    call_row{SYS_read,            "read"                                   },
    call_row{SYS_write,           "write"                                  },
    call_row{SYS_recvfrom,        "recvfrom"                               },
    call_row{SYS_recvmsg,         "recvmsg"                                },
    call_row{SYS_sendto,          "sendto"                                 },
    call_row{SYS_sendmsg,         "sendmsg"                                },
    call_row{SYS_connect,         "connect"                                },
    call_row{SYS_accept4,         "accept4"                                },
    call_row{SYS_ppoll,           "ppoll"                                  },
    call_row{SYS_pselect6,        "pselect6"                               },
    call_row{SYS_epoll_pwait,     "epoll_pwait"                            },
    call_row{SYS_nanosleep,       "nanosleep"                              },
    call_row{SYS_clock_nanosleep, "clock_nanosleep"                        },
    call_row{SYS_wait4,           "wait4 (a child process)"                },
    call_row{SYS_waitid,          "waitid (a child process)"               },
    call_row{SYS_flock,           "flock"                                  },
    call_row{SYS_fcntl,           "fcntl (a file lock)"                    },
    call_row{SYS_openat,          "openat"                                 },
    call_row{SYS_rt_sigtimedwait, "sigtimedwait"                           },
 // Not every processor's kernel has the old ones.
#ifdef SYS_poll
    call_row{SYS_poll,            "poll"                                   },
#endif
#ifdef SYS_select
    call_row{SYS_select,          "select"                                 },
#endif
#ifdef SYS_epoll_wait
    call_row{SYS_epoll_wait,      "epoll_wait"                             },
#endif
#ifdef SYS_pause
    call_row{SYS_pause,           "pause"                                  },
#endif
};

std::string first_line(const fs::path &path)
{
    std::string line;
    std::ifstream in(path);
    std::getline(in, line);
    return line;
}

std::vector<fs::path> tasks_of(pid_t pid)
{
    std::vector<fs::path> tasks;
    std::error_code failure;
    for (fs::directory_iterator entry("/proc/" + std::to_string(pid) + "/task", failure), end; !failure && entry != end;
         entry.increment(failure)) {
        tasks.push_back(entry->path());
    }
    std::sort(tasks.begin(), tasks.end());
    return tasks;
}

// The letter behind the program's name, which may itself hold anything.
char state_of(const fs::path &task)
{
    const std::string stat = first_line(task / "stat");
    const size_t end = stat.rfind(')');
    return end == std::string::npos || end + 2 >= stat.size() ? '?' : stat[end + 2];
}

std::string place_of(const fs::path &task)
{
    const std::string call = first_line(task / "syscall");
    const long number = strtol(call.c_str(), nullptr, 10);
    for (const call_row &row : call_rows) {
        if (!call.empty() && row.number == number) {
            return row.name;
        }
    }
    const std::string kernel = first_line(task / "wchan");
    return call.empty() && kernel.size() > 1 ? kernel : "system call " + call.substr(0, call.find(' '));
}
} // namespace

process_activity what_it_does(pid_t pid)
{
    process_activity doing = process_activity::ASLEEP;
    for (const fs::path &task : tasks_of(pid)) {
        const char state = state_of(task);
        if (state == 'T' || state == 't') {
            return process_activity::HELD;
        }
        if (state != 'S' || !first_line(task / "children").empty()) {
            doing = process_activity::BUSY;
        }
    }
    return doing;
}

bool waits_for_message(pid_t pid)
{
    for (const fs::path &task : tasks_of(pid)) {
        const std::string call = first_line(task / "syscall");
        const long number = strtol(call.c_str(), nullptr, 10);
        if (call.empty() || (call != "running" && (number == SYS_recvfrom || number == SYS_recvmsg))) {
            return true;
        }
    }
    return false;
}

std::string where_it_waits(pid_t pid)
{
    std::string list;
    int number = 0;
    for (const fs::path &task : tasks_of(pid)) {
        const char state = state_of(task);
        list += (list.empty() ? "thread " : ", thread ") + std::to_string(++number) + " (" + first_line(task / "comm") +
                ") " +
                (state == 'S'   ? "waits in " + place_of(task)
                 : state == 'R' ? "runs"
                                : std::string("is in state ") + state);
    }
    return list;
}
