#include <gmock/gmock.h>

#include <QCoreApplication>

int main(int argumentCount, char** arguments)
{
    testing::InitGoogleMock(&argumentCount, arguments);
    const QCoreApplication application(argumentCount, arguments);
    return RUN_ALL_TESTS();
}
