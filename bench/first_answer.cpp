// SPDX-License-Identifier: Apache-2.0
// The shortest application: one country question.
#include <CoreSystem.h>

#include <cstdlib>
#include <cstring>

int main()
{
    char* country = nullptr;
    CoreSystem::GetInstance()->GetCountryCodeFromMcc("450", &country);
    const bool right = country != nullptr && std::strcmp(country, "kr") == 0;
    std::free(country);
    return right ? EXIT_SUCCESS : EXIT_FAILURE;
}
