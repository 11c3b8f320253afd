#include "notification/AwaitTurn.h"

#include "notification/IPostalService.h"

#include <boost/bind/bind.hpp>

#include <future>
#include <memory>

namespace KVR {

bool AwaitTurn(IPostalService& service, std::chrono::milliseconds limit)
{
    // Shared, since its turn may come after the limit.
    const auto turn = std::make_shared<std::promise<void>>();
    std::future<void> come = turn->get_future();
    service.Post(boost::bind(&std::promise<void>::set_value, turn), 0);
    return come.wait_for(limit) == std::future_status::ready;
}

} // namespace KVR
