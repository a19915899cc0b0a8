// SPDX-License-Identifier: Apache-2.0
#include <net_connection.h>

#include "Call.h"
#include "HandleKinds.h"

namespace {

using port::CellularState;
using port::Connections;
using port::LinkState;
using port::Network;
using port::Question;

constexpr port::Codes CODES{CONNECTION_ERROR_OPERATION_FAILED, CONNECTION_ERROR_NOT_SUPPORTED,
                            CONNECTION_ERROR_PERMISSION_DENIED};

static_assert(static_cast<int>(CellularState::OutOfService) ==
                      CONNECTION_CELLULAR_STATE_OUT_OF_SERVICE &&
                  static_cast<int>(CellularState::Connected) == CONNECTION_CELLULAR_STATE_CONNECTED,
              "both count the states alike");
static_assert(static_cast<int>(LinkState::Deactivated) == CONNECTION_WIFI_STATE_DEACTIVATED &&
                  static_cast<int>(LinkState::Connected) == CONNECTION_WIFI_STATE_CONNECTED &&
                  static_cast<int>(LinkState::Deactivated) == CONNECTION_BT_STATE_DEACTIVATED &&
                  static_cast<int>(LinkState::Connected) == CONNECTION_BT_STATE_CONNECTED,
              "all count the states alike");

template <typename T, typename State>
int readState(const char* name, connection_h connection, State* state, Question question,
              port::Result<port::Sourced<T>> (Network::*read)())
{
    const port::Call call(name, CODES, {question});
    return call.run([&]() -> int {
        if (!Connections::find(connection) || state == nullptr)
            return CONNECTION_ERROR_INVALID_PARAMETER;
        return call.handOut(question, (port::backend().network().*read)(), state);
    });
}

} // namespace

int connection_create(connection_h* connection)
{
    const port::Call call(__func__, CODES,
                          {Question::Cellular, Question::Wifi, Question::Bluetooth});
    return call.run([&]() -> int {
        if (connection == nullptr)
            return CONNECTION_ERROR_INVALID_PARAMETER;
        *connection = Connections::open({});
        return CONNECTION_ERROR_NONE;
    });
}

int connection_destroy(connection_h connection)
{
    return port::Call(__func__, CODES).release([&]() -> int {
        return Connections::close(connection) ? CONNECTION_ERROR_NONE
                                              : CONNECTION_ERROR_INVALID_PARAMETER;
    });
}

int connection_get_cellular_state(connection_h connection, connection_cellular_state_e* state)
{
    return readState(__func__, connection, state, Question::Cellular, &Network::cellular);
}

int connection_get_wifi_state(connection_h connection, connection_wifi_state_e* state)
{
    return readState(__func__, connection, state, Question::Wifi, &Network::wifi);
}

int connection_get_bt_state(connection_h connection, connection_bt_state_e* state)
{
    return readState(__func__, connection, state, Question::Bluetooth, &Network::bluetooth);
}
