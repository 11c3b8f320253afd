// A device as its maker would write it, built against the installed files only.

#include <ControlStreamClient/AsyncClient.h>
#include <ControlStreamClient/Client.h>
#include <ControlStreamClient/Lint.h>

#include <iostream>

int main()
{
    try {
        ControlStream::VClient client;
        client.Connect("127.0.0.1");
        const ControlStream::VServerInformation information = client.GetServerInformation();

        ControlStream::VAsyncClient lasting{ControlStream::VAsyncOptions()};
        const bool same = lasting.GetServerInformation().get().Major == information.Major;
        if (!same || ControlStream::LintRequest("<Foo/>").Refusal.empty()) {
            return 1;
        }
        std::cout << "The host speaks " << information.Major << '.' << information.Minor << '\n';
        return 0;
    } catch (const ControlStream::VError& error) {
        std::cerr << error.what() << '\n';
        return 1;
    }
}
