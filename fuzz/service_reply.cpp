// SPDX-License-Identifier: Apache-2.0
// Any bytes as the body of a service's reply, as the bus hands it over: of the type that it says,
// with any content.
#include <string>

#include "Fuzz.h"
#include "port/linux/Properties.h"

using namespace port::linux_backend;
using port::Variant;

namespace {

constexpr const char* NAMES[] = {"Device", "State", "Sims", "Locale", "PrettyHostname", "Powered"};

template <class Answer>
void look(const Answer& answer)
{
    require(answer || !answer.error().reason.empty(), "what cannot be read has a reason");
}

void readEverything(const Properties& properties)
{
    for (const char* const name : NAMES) {
        look(properties.flag(name));
        look(properties.text(name));
        look(properties.texts(name));
        look(properties.path(name));
        look(properties.paths(name));
        look(properties.number(name));
        look(properties.signedNumber(name));
        look(properties.numberOf(name, 3));
    }
}

Variant body(const std::string& text, const char* type)
{
    GBytes* const bytes = g_bytes_new(text.data(), text.size());
    const Variant value = port::share(
        g_variant_ref_sink(g_variant_new_from_bytes(G_VARIANT_TYPE(type), bytes, FALSE)));
    g_bytes_unref(bytes);
    return value;
}

} // namespace

int LLVMFuzzerTestOneInput(const unsigned char* data, std::size_t size)
{
    const std::string text(reinterpret_cast<const char*>(data), size);
    readEverything(propertiesIn(body(text, "(a{sv})")));
    const auto objects = objectsIn(body(text, "(a{oa{sa{sv}}})"));
    look(objects);
    if (objects)
        for (const Object& object : objects.value()) {
            require(g_variant_is_object_path(object.path().c_str()), "an object has a path",
                    object.path());
            for (const char* const interface : {"org.freedesktop.ModemManager1.Modem", "", "a.b"})
                if (const auto properties = object.properties(interface))
                    readEverything(properties.value());
        }
    return 0;
}
