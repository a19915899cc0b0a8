// SPDX-License-Identifier: Apache-2.0
// Answers in the words of a device file.
#include <algorithm>

#include "../../devicefile/Schema.h"
#include "Backend.h"
#include "ModemAnswers.h"
#include "Origin.h"

namespace {

using coresystem_port::Answer;
using coresystem_port::Question;
using port::Error;
using port::FactAnswer;
using port::FactRow;
using port::FactValue;
using port::ModemReport;
using port::devicefile::Meaning;

std::string nameOf(const FactRow& row, Meaning meaning)
{
    const auto& section = *port::devicefile::findSection(row.section);
    for (const auto& name : port::devicefile::findKey(section, row.key)->names)
        if (name.meaning == meaning)
            return std::string(name.name);
    return {};
}

// The word of a value, and its kind.
Answer said(const FactRow& row, const FactValue& value)
{
    if (const auto* const text = std::get_if<std::string>(&value))
        return {*text, {}, Answer::Kind::Text};
    if (const bool* const isOn = std::get_if<bool>(&value))
        return {*isOn ? "true" : "false", {}, Answer::Kind::Switch};
    const auto number = std::get<std::int64_t>(value);
    const std::string name = nameOf(row, number);
    if (!name.empty())
        return {name, {}, Answer::Kind::Text};
    return {std::to_string(number), {}, Answer::Kind::Number};
}

Answer answer(const FactRow& row, const FactAnswer& found)
{
    Answer told;
    if (found)
        told = said(row, found.value().value);
    told.origin = port::originOf(found);
    if (told.origin.isMissing)
        told.word = nameOf(row, Meaning::Kind::NotSupported);
    return told;
}

// The same for an answer that has a method of its own in the backend.
template <typename T>
Answer answer(const char* section, const char* key, const port::Result<port::Sourced<T>>& found)
{
    return answer(*port::findFact(section, key), port::factAnswer(found));
}

Answer noAnswer(const Error& error)
{
    return {"", port::originOf(FactAnswer(error))};
}

Answer answerIn(const ModemReport& report, Question question)
{
    if (question == Question::Iccid)
        return answer("slot", "iccid", port::backend().telephony().iccid(report.slot));
    Answer found =
        noAnswer(port::notAvailable("the port has no answer of its own to this question"));
    port::eachAnswer(report, [&](Question each, const char* key, const auto& said) {
        if (each == question)
            found = answer("slot", key, said);
    });
    return found;
}

// The first of those that are used for most.
Answer answerOfModemInUse(Question question)
{
    const auto reports = port::backend().telephony().reports();
    if (!reports)
        return noAnswer(reports.error());
    const auto most =
        std::max_element(reports.value().begin(), reports.value().end(),
                         [](const ModemReport& a, const ModemReport& b) { return a.use < b.use; });
    return most != reports.value().end()
               ? answerIn(*most, question)
               : noAnswer(port::notAvailable("the telephony service knows no modem"));
}

// Without a report where none of the questions needs it.
ModemReport reportOf(const std::string& modem, const std::vector<Question>& questions)
{
    if (std::all_of(questions.begin(), questions.end(),
                    [](Question question) { return question == Question::Iccid; }))
        return port::emptyReport(modem, port::notAvailable("no modem " + modem));
    return port::reportOf(port::backend().telephony(), modem);
}

} // namespace

Answer coresystem_port::ask(Question question)
{
    port::Network& network = port::backend().network();
    switch (question) {
    case Question::Cellular:
        return answer("network", "cellular", network.cellular());
    case Question::Wifi:
        return answer("network", "wifi", network.wifi());
    case Question::Bluetooth:
        return answer("network", "bluetooth", network.bluetooth());
    case Question::Ethernet:
        return answer("network", "ethernet", network.ethernet());
    case Question::Connectivity:
        return answer("network", "connectivity", network.connectivity());
    case Question::Ssid:
        return answer("network", "ssid", network.ssid());
    default:
        break;
    }
    const FactRow* const plain = port::rowOf(question);
    return plain != nullptr ? answer(*plain, port::backend().read(question))
                            : answerOfModemInUse(question);
}

std::vector<Answer> coresystem_port::askModem(const std::string& modem,
                                              const std::vector<Question>& questions)
{
    const ModemReport report = reportOf(modem, questions);
    std::vector<Answer> answers;
    answers.reserve(questions.size());
    for (const Question question : questions)
        answers.push_back(answerIn(report, question));
    return answers;
}
