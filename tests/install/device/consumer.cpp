// SPDX-License-Identifier: Apache-2.0
// An application for a device: it knows the installed package only, and is not run here.
#include <CoreSystem.h>

#include <cstdlib>

int main()
{
    char* name = nullptr;
    CoreSystem::GetInstance()->GetCountryNameFromMcc("450", &name);
    std::free(name);
}
