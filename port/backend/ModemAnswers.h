// SPDX-License-Identifier: Apache-2.0
// The answers of a modem's report, each by its question.
#ifndef PORT_BACKEND_MODEM_ANSWERS_H
#define PORT_BACKEND_MODEM_ANSWERS_H

#include <coresystem_port.h>

#include "Telephony.h"

namespace port {

/// Visits each answer of a report, with its question and its key in a slot of a device file.
template <typename Visit>
void eachAnswer(const ModemReport& report, Visit visit)
{
    using coresystem_port::Question;
    visit(Question::OperatorName, "operator", report.operatorName);
    visit(Question::OperatorMcc, "operator_mcc", report.operatorMcc);
    visit(Question::OperatorMnc, "operator_mnc", report.operatorMnc);
    visit(Question::AccessTechnology, "access_technology", report.accessTechnology);
    visit(Question::SignalStrength, "signal", report.signal);
    visit(Question::PowerState, "power", report.power);
    visit(Question::PinTries, "pin_retries", report.pinTries);
}

} // namespace port

#endif
