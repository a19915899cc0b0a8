// SPDX-License-Identifier: Apache-2.0
#include <net_connection.h>

#include "../backend/Backend.h"
#include "HandOut.h"
#include "HandleKinds.h"
#include "Refusal.h"

namespace {

using coresystem_port::Question;
using port::CellularState;
using port::Connections;
using port::LinkState;
using port::Network;

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
int readState(connection_h connection, State* state, Question question,
              port::Result<port::Sourced<T>> (Network::*read)())
{
    if (!Connections::find(connection) || state == nullptr)
        return CONNECTION_ERROR_INVALID_PARAMETER;
    return port::guarded(
        [&] { return port::handOut(question, (port::backend().network().*read)(), state, CODES); },
        CODES.failed);
}

} // namespace

int connection_create(connection_h* connection)
{
    if (const port::Refusal refusal{__func__,
                                    {Question::Cellular, Question::Wifi, Question::Bluetooth}})
        return refusal.code();
    if (connection == nullptr)
        return CONNECTION_ERROR_INVALID_PARAMETER;
    return port::guarded(
        [connection] {
            *connection = Connections::open({});
            return CONNECTION_ERROR_NONE;
        },
        CODES.failed);
}

int connection_destroy(connection_h connection)
{
    const port::Refusal refusal{__func__};
    return refusal.after(Connections::close(connection) ? CONNECTION_ERROR_NONE
                                                        : CONNECTION_ERROR_INVALID_PARAMETER);
}

int connection_get_cellular_state(connection_h connection, connection_cellular_state_e* state)
{
    if (const port::Refusal refusal{__func__, {Question::Cellular}})
        return refusal.code();
    return readState(connection, state, Question::Cellular, &Network::cellular);
}

int connection_get_wifi_state(connection_h connection, connection_wifi_state_e* state)
{
    if (const port::Refusal refusal{__func__, {Question::Wifi}})
        return refusal.code();
    return readState(connection, state, Question::Wifi, &Network::wifi);
}

int connection_get_bt_state(connection_h connection, connection_bt_state_e* state)
{
    if (const port::Refusal refusal{__func__, {Question::Bluetooth}})
        return refusal.code();
    return readState(connection, state, Question::Bluetooth, &Network::bluetooth);
}
