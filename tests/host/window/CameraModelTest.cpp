#include "window/CameraModel.h"

#include "QuorixDataStore/DataWriter.h"
#include "QuorixDataStoreTypes/GreyscaleMode.h"
#include "host/cameras/CameraBench.h"
#include "support/WindowWait.h"

#include <QAbstractItemModelTester>
#include <QFont>
#include <QSignalSpy>
#include <QTest>

#include <memory>
#include <string>

using CameraTest::CameraBench;
using QuorixHost::VCameraModel;
using QuorixHost::VCameraSelection;

namespace {

/// The table above cameras 1 to 4, whose hardware confirms when the test says so.
class CameraModel : public CameraBench
{
protected:
    CameraModel()
    {
        for (std::uint32_t number = 1; number <= 4; ++number) {
            cameras->AddCamera(number);
        }
        model = std::make_unique<VCameraModel>(
            QuorixHost::VCameraServices{store, hardware, cameras, selection});
        QObject::connect(model.get(), &VCameraModel::EditRefused,
                         [this](const QString& reason) { refused = reason.toStdString(); });
    }

    QModelIndex Cell(int row, int column) const { return model->index(row, column); }

    std::string Text(int row, int column) const
    {
        return Cell(row, column).data().toString().toStdString();
    }

    bool IsPending(int row, int column) const
    {
        return Cell(row, column).data(VCameraModel::RolePending).toBool();
    }

    bool Edit(int row, int column, const QVariant& value)
    {
        return model->setData(Cell(row, column), value, Qt::EditRole);
    }

    bool ComesToShow(int row, int column, const std::string& text)
    {
        return TestSupport::WaitFor([&] { return Text(row, column) == text; });
    }

    const std::shared_ptr<VCameraSelection> selection = std::make_shared<VCameraSelection>();
    std::unique_ptr<VCameraModel> model;
    std::string refused;
};

} // namespace

TEST_F(CameraModel, ShowsEverySettingOfACamera)
{
    const std::vector<std::string> expected = {"qx:1", "Camera 1", "Universal", "101",
                                               "0.5",  "0.25",     "0.1",       "None"};

    ASSERT_EQ(4, model->rowCount());
    for (int column = 0; column < VCameraModel::ColumnSelected; ++column) {
        EXPECT_EQ(expected[static_cast<std::size_t>(column)], Text(0, column)) << column;
    }
    EXPECT_EQ(Qt::Unchecked, Cell(0, VCameraModel::ColumnSelected).data(Qt::CheckStateRole));
}

TEST_F(CameraModel, ShowsNothingWhereACameraLacksASetting)
{
    EXPECT_EQ("", Text(1, VCameraModel::ColumnShutter));
    EXPECT_FALSE(model->flags(Cell(1, VCameraModel::ColumnShutter)).testFlag(Qt::ItemIsEditable));
    EXPECT_FALSE(Edit(1, VCameraModel::ColumnShutter, "0.5"));
}

TEST_F(CameraModel, LetsOnlyBeEditedWhatIsTheOperators)
{
    EXPECT_TRUE(model->flags(Cell(0, VCameraModel::ColumnStrobe)).testFlag(Qt::ItemIsEditable));
    EXPECT_TRUE(model->flags(Cell(0, VCameraModel::ColumnName)).testFlag(Qt::ItemIsEditable));
    EXPECT_FALSE(model->flags(Cell(0, VCameraModel::ColumnId)).testFlag(Qt::ItemIsEditable));
    EXPECT_FALSE(model->flags(Cell(0, VCameraModel::ColumnType)).testFlag(Qt::ItemIsEditable));
    EXPECT_FALSE(Edit(0, VCameraModel::ColumnType, "Video"));
}

TEST_F(CameraModel, ShowsAProposedValueUntilTheHardwareConfirmsIt)
{
    EXPECT_TRUE(Edit(0, VCameraModel::ColumnStrobe, "0.75"));
    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnStrobe, "0.75"));
    EXPECT_TRUE(IsPending(0, VCameraModel::ColumnStrobe));
    const QModelIndex cell = Cell(0, VCameraModel::ColumnStrobe);
    EXPECT_TRUE(cell.data(Qt::FontRole).value<QFont>().italic());
    EXPECT_EQ("<p>Asked for 0.75; the camera still has 0.5</p>",
              cell.data(Qt::ToolTipRole).toString());

    Confirm();

    EXPECT_TRUE(TestSupport::WaitFor([&] { return !IsPending(0, VCameraModel::ColumnStrobe); }));
    EXPECT_EQ("0.75", Text(0, VCameraModel::ColumnStrobe));
    EXPECT_FALSE(cell.data(Qt::FontRole).isValid());
    EXPECT_EQ("<p>0.75</p>", cell.data(Qt::ToolTipRole).toString());
}

TEST_F(CameraModel, ShowsANameOnOneLineAndWithoutMarkup)
{
    EXPECT_TRUE(Edit(0, VCameraModel::ColumnName, "<b>one</b>\ntwo"));

    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnName, "<b>one</b> two"));
    const QModelIndex cell = Cell(0, VCameraModel::ColumnName);
    EXPECT_EQ("<b>one</b>\ntwo", cell.data(Qt::EditRole).toString());
    EXPECT_EQ("<p>Asked for &lt;b&gt;one&lt;/b&gt; two; the camera still has Camera 1</p>",
              cell.data(Qt::ToolTipRole).toString());
}

TEST_F(CameraModel, ShowsWhatTheHardwareMadeOfAProposal)
{
    EXPECT_TRUE(Edit(0, VCameraModel::ColumnStrobe, "5.0"));
    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnStrobe, "5.0"));

    Confirm();

    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnStrobe, "1.0"));
    EXPECT_FALSE(IsPending(0, VCameraModel::ColumnStrobe));
}

TEST_F(CameraModel, ShowsWhatADeviceAsksFor)
{
    Camera(2, "Threshold")->SetValue(MakeDoubleValue(0.125));

    EXPECT_TRUE(ComesToShow(1, VCameraModel::ColumnThreshold, "0.125"));
}

TEST_F(CameraModel, SaysWhichCellsChange)
{
    const QSignalSpy changed(model.get(), &QAbstractItemModel::dataChanged);

    Camera(3, "StrobeIntensity")->SetValue(MakeDoubleValue(0.125));
    EXPECT_TRUE(ComesToShow(2, VCameraModel::ColumnStrobe, "0.125"));

    ASSERT_EQ(1, changed.count());
    EXPECT_EQ(2, changed[0][0].toModelIndex().row());
    EXPECT_EQ(2, changed[0][1].toModelIndex().row());
}

TEST_F(CameraModel, TellsWhyAnEditIsRefused)
{
    EXPECT_FALSE(Edit(0, VCameraModel::ColumnStrobe, "much"));
    EXPECT_EQ("\"much\" is no value of StrobeIntensity", refused);

    EXPECT_FALSE(Edit(0, VCameraModel::ColumnUserId, "-1"));
    EXPECT_EQ("\"-1\" is no value of UserId", refused);

    EXPECT_FALSE(Edit(3, VCameraModel::ColumnThreshold, "0.5")); // a calibration holds it
    EXPECT_EQ("Device.qx:4.Settings.Threshold refuses to be changed", refused);
    EXPECT_EQ("0.25", Text(3, VCameraModel::ColumnThreshold));
}

TEST_F(CameraModel, TakesNamesAndNumbersAsTheyAreTyped)
{
    EXPECT_TRUE(Edit(0, VCameraModel::ColumnName, "B\u00fchne, \"links\""));
    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnName, "B\u00fchne, \"links\""));

    EXPECT_TRUE(Edit(0, VCameraModel::ColumnUserId, "4294967295"));
    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnUserId, "4294967295"));
}

TEST_F(CameraModel, ChoosesAGreyscaleModeByItsNumber)
{
    EXPECT_TRUE(Edit(0, VCameraModel::ColumnGreyscale, 4));

    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnGreyscale, "Edges"));
    EXPECT_EQ(4, Cell(0, VCameraModel::ColumnGreyscale).data(Qt::EditRole));
}

TEST_F(CameraModel, ShowsAModeThatThereIsNotByItsNumber)
{
    Camera(1, "GreyscaleMode")->SetValue(MakeEnumValue(GreyscaleModeSchema(), 17));

    EXPECT_TRUE(ComesToShow(0, VCameraModel::ColumnGreyscale, "17"));
}

TEST_F(CameraModel, SelectsAndShowsTheSelection)
{
    EXPECT_TRUE(
        model->setData(Cell(2, VCameraModel::ColumnSelected), Qt::Checked, Qt::CheckStateRole));
    std::vector<VSelectionEntry> entries;
    selection->GetView()->GetSelection(VCameraSelection::CameraFilter(), entries);
    std::string id;
    ASSERT_EQ(1U, entries.size());
    EXPECT_TRUE(entries[0].GetDeviceId(id));
    EXPECT_EQ("qx:3", id);

    selection->GetView()->SetSelection({VSelectionEntry("qx:1")}, VCameraSelection::CameraFilter());

    const auto checked = [&](int row) {
        return Cell(row, VCameraModel::ColumnSelected).data(Qt::CheckStateRole) == Qt::Checked;
    };
    EXPECT_TRUE(TestSupport::WaitFor([&] { return checked(0) && !checked(2); }));
}

TEST_F(CameraModel, FollowsCamerasThatComeAndGo)
{
    const QAbstractItemModelTester tester(model.get(),
                                          QAbstractItemModelTester::FailureReportingMode::Fatal);

    cameras->RemoveCamera(2);
    cameras->AddCamera(7);

    EXPECT_TRUE(
        TestSupport::WaitFor([&] { return model->rowCount() == 4 && Text(3, 0) == "qx:7"; }));
    EXPECT_EQ("qx:3", Text(1, 0));
    cameras->AddCamera(2);
    EXPECT_TRUE(ComesToShow(1, 0, "qx:2"));
    EXPECT_EQ(5, model->rowCount());
}

TEST_F(CameraModel, SurvivesChangesAfterItsEnd)
{
    model.reset();

    Camera(1, "StrobeIntensity")->SetValue(MakeDoubleValue(0.125));
    selection->GetView()->SetSelection({VSelectionEntry("qx:1")}, VCameraSelection::CameraFilter());
    Confirm();

    EXPECT_EQ(0.125, Verified("Device.qx:1.Settings.StrobeIntensity"));
}
