#include "answer.h"

#include <nlohmann/json.hpp>

NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(breach, broken)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(finding, what, oddity, history, times, scenario, shows)
NLOHMANN_DEFINE_TYPE_NON_INTRUSIVE(search_result, states, transitions, stimuli, depth, complete, interrupted, bytes,
                                   seconds, findings)

void write_result(FILE *out, const search_result &result)
{
    const std::string text = nlohmann::json(result).dump();
    fwrite(text.data(), 1, text.size(), out);
}

bool read_result(FILE *in, search_result &result)
{
    const nlohmann::json answer = nlohmann::json::parse(in, nullptr, false);
    if (answer.is_discarded()) {
        return false;
    }
    const search_plan plan = result.plan;
    answer.get_to(result);
    result.plan = plan;
    return true;
}
