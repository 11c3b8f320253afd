#include "QuorixPluginControlStreamServer/Authorization/QuorixManagementModel.h"

#include <QAbstractItemModelTester>
#include <QMetaMethod>
#include <QSignalSpy>
#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <vector>

namespace {

const VControlDevices threeDevices = {
    {"1", {true, "cello"}}, {"2", {false, "Alto"}}, {"3", {true, "bass"}}};

QVariant DataOf(const VQuorixManagementModel& model, int row, int role)
{
    return model.data(model.index(row, 0), role);
}

std::vector<std::string> NamesOf(const VQuorixManagementModel& model)
{
    std::vector<std::string> names;
    for (int row = 0; row < model.rowCount(); ++row) {
        names.push_back(
            DataOf(model, row, VQuorixManagementModel::RoleName).toString().toStdString());
    }
    return names;
}

using Names = std::vector<std::string>;

} // namespace

TEST(ManagementModel, SortsItsRowsByNameWithoutRegardToCase)
{
    const VQuorixManagementModel model(threeDevices);

    EXPECT_EQ((Names{"Alto", "bass", "cello"}), NamesOf(model));
}

TEST(ManagementModel, KeepsDevicesOfOneNameInTheOrderOfTheirIds)
{
    const VQuorixManagementModel model(
        {{"b", {true, "Same"}}, {"a", {true, "same"}}, {"c", {true, "SAME"}}});

    EXPECT_EQ("a", DataOf(model, 0, 0).toString());
    EXPECT_EQ("b", DataOf(model, 1, 0).toString());
    EXPECT_EQ("c", DataOf(model, 2, 0).toString());
}

TEST(ManagementModel, NamesItsRolesForQml)
{
    const QHash<int, QByteArray> expected = {{0, "itemId"}, {1, "itemName"}, {2, "itemAuthorised"}};

    EXPECT_EQ(expected, VQuorixManagementModel({}).roleNames());
}

TEST(ManagementModel, AnswersEachRoleByItsType)
{
    const VQuorixManagementModel model({{"id-\u00e9", {true, "T\u00e2blet"}}});

    EXPECT_EQ(QVariant(QString::fromUtf8("id-\u00e9")), DataOf(model, 0, 0));
    EXPECT_EQ(QVariant(QString::fromUtf8("T\u00e2blet")), DataOf(model, 0, 1));
    EXPECT_EQ(QVariant(true), DataOf(model, 0, 2));
}

TEST(ManagementModel, AnswersWhatThereIsNotByNothing)
{
    const VQuorixManagementModel model(threeDevices);

    EXPECT_EQ(QVariant(), DataOf(model, 0, 3));
    EXPECT_EQ(QVariant(), DataOf(model, 0, -1));
    EXPECT_EQ(QVariant(), DataOf(model, 3, 0));
    EXPECT_EQ(QVariant(), model.data(QModelIndex(), 0));
}

TEST(ManagementModel, HasThreeColumnsAndNoTree)
{
    const VQuorixManagementModel model(threeDevices);

    EXPECT_EQ(3, model.rowCount());
    EXPECT_EQ(3, model.columnCount());
    EXPECT_TRUE(model.index(2, 2).isValid());
    EXPECT_FALSE(model.index(3, 0).isValid());
    EXPECT_FALSE(model.index(0, 3).isValid());
    EXPECT_FALSE(model.index(-1, 0).isValid());
    EXPECT_FALSE(model.parent(model.index(0, 0)).isValid());
    EXPECT_FALSE(model.index(0, 0, model.index(0, 0)).isValid());
}

TEST(ManagementModel, KeepsTheRulesOfModels)
{
    VQuorixManagementModel model(threeDevices);
    const QAbstractItemModelTester tester(&model,
                                          QAbstractItemModelTester::FailureReportingMode::Fatal);

    model.setData(model.index(0, 0), true, 2);
    model.forgetItem(1);
    model.forgetEverthing();

    EXPECT_EQ(0, model.rowCount());
}

TEST(ManagementModel, ReturnsFalseAfterAChangeAndTellsOfIt)
{
    VQuorixManagementModel model(threeDevices);
    const QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);

    EXPECT_FALSE(model.setData(model.index(0, 0), true, 2));

    EXPECT_EQ(QVariant(true), DataOf(model, 0, 2));
    ASSERT_EQ(1, changed.count());
    EXPECT_EQ(model.index(0, 0), changed[0][0].toModelIndex());
    EXPECT_EQ(model.index(0, 0), changed[0][1].toModelIndex());
}

TEST(ManagementModel, TellsNothingWhereTheFlagStays)
{
    VQuorixManagementModel model(threeDevices);
    const QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);

    EXPECT_FALSE(model.setData(model.index(0, 0), false, 2));

    EXPECT_EQ(0, changed.count());
}

TEST(ManagementModel, ChangesNoOtherRole)
{
    VQuorixManagementModel model(threeDevices);
    const QSignalSpy changed(&model, &QAbstractItemModel::dataChanged);

    EXPECT_FALSE(model.setData(model.index(0, 0), "Viola", 1));
    EXPECT_FALSE(model.setData(model.index(0, 0), "9", 0));
    EXPECT_FALSE(model.setData(QModelIndex(), true, 2));

    EXPECT_EQ(threeDevices, model.GetDevices());
    EXPECT_EQ(0, changed.count());
}

TEST(ManagementModel, ReturnsFalseAfterARemovalAndTellsOfIt)
{
    VQuorixManagementModel model(threeDevices);
    const QSignalSpy begun(&model, &QAbstractItemModel::rowsAboutToBeRemoved);
    const QSignalSpy ended(&model, &QAbstractItemModel::rowsRemoved);

    EXPECT_FALSE(model.removeRows(0, 2));

    EXPECT_EQ(Names{"cello"}, NamesOf(model));
    ASSERT_EQ(1, begun.count());
    ASSERT_EQ(1, ended.count());
    EXPECT_EQ(0, ended[0][1].toInt());
    EXPECT_EQ(1, ended[0][2].toInt());
}

TEST(ManagementModel, RemovesNoRowsThatAreNotAllThere)
{
    constexpr int greatest = std::numeric_limits<int>::max();
    VQuorixManagementModel model(threeDevices);
    const QSignalSpy begun(&model, &QAbstractItemModel::rowsAboutToBeRemoved);

    EXPECT_FALSE(model.removeRows(2, 2));
    EXPECT_FALSE(model.removeRows(-1, 1));
    EXPECT_FALSE(model.removeRows(3, 1));
    EXPECT_FALSE(model.removeRows(0, 0));
    EXPECT_FALSE(model.removeRows(1, -1));
    EXPECT_FALSE(model.removeRows(greatest, greatest));
    EXPECT_FALSE(model.removeRows(0, 1, model.index(0, 0)));

    EXPECT_EQ(3, model.rowCount());
    EXPECT_EQ(0, begun.count());
}

TEST(ManagementModel, ForgetsOneDevice)
{
    VQuorixManagementModel model(threeDevices);

    model.forgetItem(1);
    model.forgetItem(-1); // of a row that is on its way out
    model.forgetItem(2);

    EXPECT_EQ((Names{"Alto", "cello"}), NamesOf(model));
}

TEST(ManagementModel, ForgetsEverything)
{
    VQuorixManagementModel model(threeDevices);

    model.forgetEverthing();
    model.forgetEverthing();

    EXPECT_EQ(0, model.rowCount());
}

TEST(ManagementModel, GivesBackWhatIsLeft)
{
    VQuorixManagementModel model(threeDevices);
    EXPECT_EQ(threeDevices, model.GetDevices());

    model.forgetItem(0);

    EXPECT_EQ((VControlDevices{{"1", {true, "cello"}}, {"3", {true, "bass"}}}), model.GetDevices());
}

TEST(ManagementModel, OffersItsTwoOperationsToQmlBySpelling)
{
    const QMetaObject& meta = VQuorixManagementModel::staticMetaObject;

    EXPECT_GE(meta.indexOfMethod("forgetEverthing()"), 0);
    EXPECT_GE(meta.indexOfMethod("forgetItem(int)"), 0);
}
