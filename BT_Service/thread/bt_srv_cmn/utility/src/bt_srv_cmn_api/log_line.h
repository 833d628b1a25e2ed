// The lines that the framework and event distribution write. Each is one call through the log pointer: with the stub
// attached nothing happens but the passing of arguments.
#pragma once

#include <bt_service/bt_log.h>

#include <cstdint>

namespace bt::cmn {

constexpr char kApiSource[] = "BT_Service/api/../thread/bt_srv_cmn/utility/src/bt_srv_cmn_api";
constexpr char kModelSource[] = "BT_Service/api/../thread/bt_srv_cmn/utility/src/bt_srv_cmn_model";

constexpr int32_t kSuccess = 0;
constexpr int32_t kFailure = 1;

// The end of a function with a result: `return ended(__func__, kFailure);`
template <class Result>
Result ended(const char* function, Result result)
{
    BT_CMN_logout_wrapperFunc("CMN", "[API][END] %s (%d)", function, static_cast<int>(result));
    return result;
}

} // namespace bt::cmn

#define CMN_LOG(...) BT_CMN_logout_wrapperFunc("CMN", __VA_ARGS__)
#define CMN_LOG_START() CMN_LOG("[API][START] %s", __func__)

// A line that says where it was written: CMN_LOG(CMN_AT "malloc err. ( event cnt = %d ) ", CMN_API_PLACE, count)
#define CMN_AT "[API][%s][%s][%d] "
#define CMN_API_PLACE bt::cmn::kApiSource, __func__, __LINE__
#define CMN_MODEL_PLACE bt::cmn::kModelSource, __func__, __LINE__
