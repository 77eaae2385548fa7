#include "junit.h"

#include "player.h"

#include <algorithm>

namespace
{
// What XML 1.0 cannot hold becomes a question mark.
std::string escaped(const std::string &text)
{
    std::string out;
    for (const char c : text) {
        switch (c) {
        case '&':
            out += "&amp;";
            break;
        case '<':
            out += "&lt;";
            break;
        case '>':
            out += "&gt;";
            break;
        case '"':
            out += "&quot;";
            break;
        default:
            out += static_cast<unsigned char>(c) < 0x20 && c != '\n' && c != '\t' ? '?' : c;
        }
    }
    return out;
}

std::string seconds(double time)
{
    std::string text = std::to_string(time);
    return text.substr(0, text.find('.') + 4);
}

std::string test_case(const run_outcome &outcome)
{
    const size_t slash = outcome.path.rfind('/');
    const std::string folder = slash == std::string::npos ? "." : outcome.path.substr(0, slash);
    std::string text = "  <testcase classname=\"" + escaped(folder) + "\" name=\"" +
                       escaped(outcome.path.substr(slash + 1)) + "\" assertions=\"" + std::to_string(outcome.held) +
                       "\" time=\"" + seconds(outcome.real_s) + "\">\n";
    if (outcome.result != PLAY_HELD) {
        const std::string kind = outcome.result == PLAY_FAILED ? "failure" : "error";
        text += "    <" + kind + " message=\"" + escaped(outcome.failure.substr(0, outcome.failure.find('\n'))) +
                "\">" + escaped(outcome.failure) + "</" + kind + ">\n";
    }
    if (!outcome.warnings.empty()) {
        text += "    <system-err>" + escaped(outcome.warnings) + "</system-err>\n";
    }
    return text + "  </testcase>\n";
}
} // namespace

std::string junit_report(const std::vector<run_outcome> &outcomes)
{
    const auto count = [&](int result) {
        return std::to_string(std::count_if(outcomes.begin(), outcomes.end(),
                                            [result](const run_outcome &outcome) { return outcome.result == result; }));
    };
    double time = 0;
    std::string cases;
    for (const run_outcome &outcome : outcomes) {
        time += outcome.real_s;
        cases += test_case(outcome);
    }
    return "<?xml version=\"1.0\" encoding=\"UTF-8\"?>\n<testsuite name=\"kiv_led_sim\" tests=\"" +
           std::to_string(outcomes.size()) + "\" failures=\"" + count(PLAY_FAILED) + "\" errors=\"" +
           count(PLAY_IMPOSSIBLE) + "\" time=\"" + seconds(time) + "\">\n" + cases + "</testsuite>\n";
}
