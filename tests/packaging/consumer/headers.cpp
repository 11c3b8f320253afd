// Includes what others build with, and uses a value of the store.

#include <ControlStreamClient/AsyncClient.h>
#include <ControlStreamClient/Authorization.h>
#include <ControlStreamClient/Client.h>
#include <ControlStreamClient/Discovery.h>
#include <ControlStreamClient/EventHandlers.h>
#include <ControlStreamClient/Lint.h>
#include <ControlStreamClient/Outcome.h>
#include <ControlStreamClient/Requests.h>
#include <QuorixDataStore/DataReader.h>
#include <QuorixDataStore/DataStore.h>
#include <QuorixDataStore/DataWriter.h>
#include <QuorixDataStoreTypes/DeviceSchemas.h>
#include <QuorixPluginControlStreamServer/ControlSystem/IControlSystem.h>
#include <QuorixPluginInterface/IHost.h>
#include <QuorixPluginInterface/IPlugin.h>
#include <QuorixPreferences/Preferences.h>
#include <io/Values.h>

#include <iostream>

int main()
{
    const VDataValue value = MakeBoolValue(true);
    bool read = false;
    if (!ReadValue(value, read) || !read) {
        return 1;
    }
    VDataStore store;
    std::cout << "Every header stands by itself\n";
    return 0;
}
