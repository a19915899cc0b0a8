// SPDX-License-Identifier: Apache-2.0
// A service as a table: what it shows for which facts, and what a client may do to it.
#ifndef PORT_PLAYED_SERVICE_H
#define PORT_PLAYED_SERVICE_H

#include <string>
#include <vector>

#include "Facts.h"
#include "Interfaces.h"

namespace port::played {

/// An object of an interface, with every property.
struct Face {
    std::string interface;
    Values known;
    const Values& defaults; // of the interface: the properties of which nothing is known

    /// The value of a property that the interface has; lives as long as this does.
    GVariant* value(const std::string& property) const;
    Values all() const;
};

struct Object {
    std::string path;
    std::vector<Face> faces;
    bool isListed = true; // by the object manager

    const Face* find(const std::string& interface) const;
};

/// All objects of a service, in the order in which it tells of changes.
using World = std::vector<Object>;

/// A modem that loses or gets its card is another object than before, with the next number.
class ModemNumbers {
public:
    /// To be called once for every new state of the facts.
    void follow(const std::vector<SlotFacts>& slots);
    int numberOf(const SlotFacts& slot) const;
    static bool hasFailed(const SlotFacts& slot);

private:
    struct Row {
        int number;
        bool hasFailed;
    };
    std::map<std::string, Row> rows_; // by the slot's name
    int next_ = 0;
};

struct Scene {
    const Facts& facts;
    const ModemNumbers& modems;
};

/// A client's call. Its arguments have the types of the interface.
struct Request {
    const Scene& scene;
    const World& world;
    std::string path;
    std::string interface;
    std::string member; // a method, or the property that is to be set
    GVariant* arguments;

    /// The value of a property of the interface, which the object must have.
    GVariant* value(const std::string& property) const;
};

struct Outcome {
    std::string error; // the error's name; empty: it is done
    std::string text;
    std::vector<devicefile::Edit> changes; // of the device file
    Variant reply;                         // a tuple; null: empty

    static Outcome refuse(std::string name, std::string text)
    {
        return {std::move(name), std::move(text), {}, nullptr};
    }
    static Outcome change(std::vector<devicefile::Edit> changes)
    {
        return {"", "", std::move(changes), nullptr};
    }
    static Outcome answer(GVariant* reply)
    {
        return {"", "", {}, share(g_variant_ref_sink(reply))};
    }
};

struct Act {
    const char* interface;
    const char* member;
    Outcome (*act)(const Request&);
};

/// A signal that goes with a change of a property, beside PropertiesChanged.
struct Tale {
    const char* interface;
    const char* property;
    const char* signal;
    bool isBefore; // PropertiesChanged
    GVariant* (*arguments)(GVariant* before, GVariant* after);
};

/// Signals for what comes to a list of objects and what goes from it.
struct ListTale {
    const char* interface;
    const char* property;
    const char* added;
    const char* removed;
};

/// A signal that tells that a method, one without arguments, answers otherwise than before.
struct AnswerTale {
    const char* interface;
    const char* method;
    const char* signal;
};

struct Role {
    const char* name; // in the device file
    const char* busName;
    const char* manager; // the path of its object manager; null: it has none
    World (*worldOf)(const Scene&);
    bool (*isThere)(const Facts&); // null: always
    std::vector<Act> methods;
    std::vector<Act> setters;
    std::vector<Tale> tales;
    std::vector<ListTale> lists;
    Outcome (*refuse)(const Request&); // what a client may not, or the device file cannot hold
    bool removesFirst;                 // tells of what goes before what comes, else at the end
    std::vector<AnswerTale> answers = {};
};

const Role& modemManager();
const Role& networkManager();
const Role& bluez();
const Role& hostname1();
const Role& locale1();
const std::vector<const Role*>& allServices();

// For the tables.
Face face(const char* interface, Values known = {});
Variant value(const char* format, ...);
Variant textOf(const std::string& text);
Variant pathOf(const std::string& path);
/// PREFIX/NUMBER: a path.
std::string numbered(const char* prefix, int number);
Variant texts(const std::vector<std::string>& all, const char* type = "as");
/// "1.42.4": that of the headers, since nmcli warns of a service of another version than its own.
std::string versionText(int major, int minor, int micro);
devicefile::Edit set(const std::string& path, const char* value);
devicefile::Edit unset(const std::string& path);
std::string slotKey(std::size_t slot, const char* key);
/// Answers a call that has no effect here.
Outcome nothing(const Request& request);
/// The changes that switch the cellular radio.
std::vector<devicefile::Edit> cellularSwitch(const Facts& facts, bool on);
std::vector<devicefile::Edit> wifiSwitch(const Facts& facts, bool on);
std::vector<devicefile::Edit> bluetoothSwitch(const Facts& facts, bool on);

} // namespace port::played

#endif
