#include <QCoreApplication>

#include <gtest/gtest.h>

#include <optional>

namespace {

/// The application object of all tests of this binary: one without windows, as a host that runs
/// headless has it.
class VApplicationEnvironment : public testing::Environment
{
public:
    void SetUp() override
    {
        application.emplace(argumentCount, arguments);
        QCoreApplication::setApplicationName("Quorix");
    }
    void TearDown() override { application.reset(); }

private:
    int argumentCount = 1;
    char name[5] = "test";
    char* arguments[2] = {name, nullptr};
    std::optional<QCoreApplication> application;
};

testing::Environment* const environment =
    testing::AddGlobalTestEnvironment(new VApplicationEnvironment);

} // namespace
