// Each data dialog's OK against the command-line tool doing the same on a
// copy of the same sample, plus the refusals and quirks a user meets.
// The fixture names a variable "slots", which Qt takes for a keyword: it
// comes first.
#include "tests/ops/data_ops_fixture.h"

#include <QCheckBox>
#include <QFileDialog>
#include <QImage>
#include <QRegularExpression>
#include <QLabel>
#include <QProcess>
#include <QComboBox>
#include <QLineEdit>
#include <QMessageBox>
#include <QPrinter>
#include <QRadioButton>
#include <QtTest>

#include "design/link_access.h"
#include "gui/common/help.h"
#include "engine/record.h"
#include "gui/data/csv_dialogs.h"
#include "gui/data/data_commands.h"
#include "gui/data/filter_dialog.h"
#include "gui/data/print_listing.h"
#include "gui/data/report_dialogs.h"
#include "gui/data/search_dialog.h"
#include "gui/data/sorting_dialog.h"
#include "ops/linked_listing.h"
#include "ops/sort.h"
#include "ops/view.h"
#include "platform/qt/qt_platform.h"
#include "platform/text_codec.h"
#include "tests/gui/data/data_test_support.h"

namespace cx::testing {

class DataDialogsTest : public QObject {
  Q_OBJECT

  // One open copy of a sample, as a document would hold it.
  struct Open {
    explicit Open(const std::string& path) : session(db, locale, ui) {
      ok = static_cast<bool>(db.Open(path, ui));
      session.view = RebuildView(db);
    }
    // The tool reads the system's regional settings, as the desktop does.
    LocaleInfo locale = SystemLocaleInfo();
    ScriptedUi ui;
    Database db;
    DataSession session;
    bool ok = false;
    int viewChanges = 0;
    gui::DataTarget Target() {
      return gui::DataTarget(session, [this] { ++viewChanges; });
    }
  };

  static std::vector<std::string> Records(const Database& db, const std::vector<uint32_t>& view) {
    std::vector<std::string> out;
    for (uint32_t i : view) out.emplace_back(reinterpret_cast<const char*>(db.record(i).data()), db.record(i).size());
    return out;
  }
  static std::vector<uint32_t> All(const Database& db) {
    std::vector<uint32_t> v(db.recordCount());
    for (size_t i = 0; i < v.size(); ++i) v[i] = static_cast<uint32_t>(i);
    return v;
  }

 private slots:
  void sortingOkSortsAsTheToolDoes() {
    TempDir dir;
    const std::string cli = CopySample("Orders", dir.path(), "A"), ours = CopySample("Orders", dir.path(), "B");
    RunCli({"sort", QString::fromStdString(cli), "Item:reverse", "Quantity"});
    Open a(cli), b(ours);
    QVERIFY(a.ok && b.ok);

    gui::SortingDialog dialog(b.db, b.ui);
    dialog.findChild<QComboBox*>("primaryField")->setCurrentIndex(1 + 1);  // Item
    dialog.findChild<QRadioButton*>("primaryReverse")->setChecked(true);
    dialog.findChild<QComboBox*>("secondaryField")->setCurrentIndex(3 + 1);  // Quantity
    dialog.findChild<QRadioButton*>("secondaryForward")->setChecked(true);
    dialog.accept();
    QCOMPARE(dialog.result(), int(QDialog::Accepted));
    SortAfterDialog(b.session);
    QCOMPARE(Records(b.db, All(b.db)), Records(a.db, All(a.db)));
    QCOMPARE(b.db.schema().sortKey, a.db.schema().sortKey);
    QVERIFY(b.ui.messages.empty());
  }

  void sortingRefusesAnImageKeyAndStaysOpen() {
    TempDir dir;
    Open c(CopySample("Contacts", dir.path()));
    QVERIFY(c.ok);
    const auto keys = c.db.schema().sortKey;
    gui::SortingDialog dialog(c.db, c.ui);
    dialog.show();
    dialog.findChild<QComboBox*>("primaryField")->setCurrentIndex(0 + 1);    // Name
    dialog.findChild<QComboBox*>("secondaryField")->setCurrentIndex(9 + 1);  // Photo, an Image
    dialog.accept();
    QVERIFY(dialog.isVisible());
    QCOMPARE(c.ui.messages.size(), size_t(1));
    QCOMPARE(c.ui.messages[0].text, std::string("This type of field (Photo) cannot currently be sorted!\n"));
    QCOMPARE(c.ui.messages[0].caption, std::string("ERROR!"));
    QCOMPARE(c.db.schema().sortKey, keys);
    QVERIFY(!c.db.changed());
  }

  void filterOkShowsTheRecordsTheToolLeavesInView() {
    TempDir dir;
    const std::string cli = CopySample("Contacts", dir.path(), "A"), ours = CopySample("Contacts", dir.path(), "B");
    RunCli({"filter", QString::fromStdString(cli), "--filter1", "Category=Work", "--not1", "--filter2",
            "Name=o"});
    Open a(cli), b(ours);
    QVERIFY(a.ok && b.ok);

    auto* dialog = new gui::EditFiltersDialog(b.db);
    dialog->findChild<QCheckBox*>("filter1Enabled")->setChecked(true);
    dialog->findChild<QComboBox*>("filter1Field")->setCurrentIndex(3);  // Category
    auto* popup = dialog->findChild<QComboBox*>("filter1Popup");
    popup->setCurrentIndex(popup->findText("Work"));
    dialog->findChild<QCheckBox*>("filter1Not")->setChecked(true);
    dialog->findChild<QCheckBox*>("filter2Enabled")->setChecked(true);
    dialog->findChild<QComboBox*>("filter2Field")->setCurrentIndex(0);  // Name
    dialog->findChild<QLineEdit*>("filter2MustContain")->setText("o");
    dialog->findChild<QRadioButton*>("andButton")->setChecked(true);
    // A field switched away from and back keeps what was typed for it.
    dialog->findChild<QComboBox*>("filter2Field")->setCurrentIndex(3);
    dialog->findChild<QComboBox*>("filter2Field")->setCurrentIndex(0);
    QCOMPARE(dialog->findChild<QLineEdit*>("filter2MustContain")->text(), QString("o"));
    dialog->accept();
    QCOMPARE(dialog->result(), int(QDialog::Accepted));
    delete dialog;
    b.session.view = RebuildView(b.db);
    QCOMPARE(b.session.view, a.session.view);
    QVERIFY(b.session.view.size() > 0 && b.session.view.size() < b.db.recordCount());

    gui::DataTarget target = b.Target();
    gui::DisableFiltersCommand(target);
    QCOMPARE(b.session.view.size(), b.db.recordCount());
    QCOMPARE(b.viewChanges, 1);
  }

  void noValueOnFilterTwoEmptiesTheView() {
    TestDb t;
    const int colour = t.Field(FieldType::PopUp, "Colour");
    t.db.popups()[colour].items = {"Red", "Blue"};
    t.Add({Byte(colour, 0)});
    t.Add({Byte(colour, 255)});
    t.Add({Byte(colour, 1)});
    for (int n : {1, 2}) {
      gui::EditFiltersDialog dialog(t.db);
      const QString k = QString::number(n), other = QString::number(3 - n);
      dialog.findChild<QCheckBox*>("filter" + k + "Enabled")->setChecked(true);
      dialog.findChild<QCheckBox*>("filter" + other + "Enabled")->setChecked(false);
      dialog.findChild<QComboBox*>("filter" + k + "Field")->setCurrentIndex(colour);
      auto* popup = dialog.findChild<QComboBox*>("filter" + k + "Popup");
      QCOMPARE(popup->itemText(0), QString("No Value"));
      popup->setCurrentIndex(0);
      dialog.accept();
      const auto view = RebuildView(t.db);
      if (n == 1) {
        QCOMPARE(view, std::vector<uint32_t>{1});
      } else {
        QVERIFY(view.empty());  // stored as 597, which no record holds
      }
    }
  }

  void filterRefusesLimitsThatAreNotNumbers() {
    TempDir dir;
    Open o(CopySample("Orders", dir.path()));
    gui::EditFiltersDialog dialog(o.db);
    dialog.show();
    dialog.findChild<QCheckBox*>("filter1Enabled")->setChecked(true);
    dialog.findChild<QComboBox*>("filter1Field")->setCurrentIndex(3);  // Quantity
    dialog.findChild<QLineEdit*>("filter1Lower")->setText("two");
    dialog.findChild<QLineEdit*>("filter1Upper")->setText("5");
    ModalAnswers answers({[](QWidget* box) {
      QVERIFY(box->findChildren<QLabel*>().size() > 0);
      Reject(box);
    }});
    dialog.accept();
    QVERIFY(answers.allAnswered());
    QVERIFY(dialog.isVisible());
    QVERIFY(!o.db.changed());
  }

  void findSelectsTheToolsHitAndACancelledSearchChangesNothing() {
    TempDir dir;
    const std::string cli = CopySample("Contacts", dir.path(), "A");
    const QByteArray out = RunCli({"find", QString::fromStdString(cli), "lyon"});
    const int cliIndex = out.split('\t').value(0).toInt();
    Open c(cli);
    int shownRecord = -1, shownColumn = -2;
    gui::DataTarget target = c.Target();
    target.showHit = [&](int record, int column) { shownRecord = record, shownColumn = column; };

    ModalAnswers answers({[](QWidget* w) {
      w->findChild<QLineEdit*>("searchText")->setText("lyon");
      w->findChild<QCheckBox*>("searchAllFields")->setChecked(true);
      qobject_cast<QDialog*>(w)->accept();
    }});
    const int index = gui::SearchDatabaseCommand(nullptr, target);
    QCOMPARE(index, cliIndex);
    QCOMPARE(shownRecord, cliIndex);
    QCOMPARE(shownColumn, c.session.found.column);
    QVERIFY(c.ui.messages.empty());

    // Cancelled: no search, no message, settings as they were.
    const SearchSettings before = LoadSearchSettings(c.db.schema());
    shownRecord = -1;
    ModalAnswers cancel({[](QWidget* w) {
      w->findChild<QLineEdit*>("searchText")->setText("zzz");
      Reject(w);
    }});
    QCOMPARE(gui::SearchDatabaseCommand(nullptr, target), -1);
    QCOMPARE(shownRecord, -1);
    QVERIFY(c.ui.messages.empty());
    QCOMPARE(LoadSearchSettings(c.db.schema()).text, before.text);

    // Find Again past the last hit reports and does not wrap.
    QCOMPARE(gui::FindAgainCommand(nullptr, target), -1);
    QCOMPARE(c.ui.messages.size(), size_t(1));
    QCOMPARE(c.ui.messages[0].text, std::string("Not Found in Database!\n"));
  }

  void exportWritesTheToolsBytes() {
    TempDir dir;
    const std::string src = CopySample("Contacts", dir.path());
    RunCli({"filter", QString::fromStdString(src), "--filter1", "Favorite=1"});
    const std::string cliOut = dir.File("cli.csv"), ourOut = dir.File("ours.csv"), utf8Out = dir.File("utf8.csv");
    RunCli({"export-csv", QString::fromStdString(src), QString::fromStdString(cliOut), "--header", "--quote-all",
            "--filtered", "--slot-order", "--encoding", "windows-1252"});
    Open c(src);
    gui::DataTarget target = c.Target();
    for (const std::string& path : {ourOut, utf8Out}) {
      ModalAnswers answers({[&](QWidget* w) {
        w->findChild<QLineEdit*>("csvExportPath")->setText(QString::fromStdString(path));
        w->findChild<QCheckBox*>("csvHeader")->setChecked(true);
        w->findChild<QCheckBox*>("csvQuoteAll")->setChecked(true);
        w->findChild<QCheckBox*>("csvFiltered")->setChecked(true);
        w->findChild<QCheckBox*>("csvSlotOrder")->setChecked(true);
        w->findChild<QComboBox*>("csvEncoding")->setCurrentIndex(path == ourOut ? 1 : 0);
        qobject_cast<QDialog*>(w)->accept();
      }});
      QVERIFY(gui::ExportCsvCommand(nullptr, target));
    }
    QCOMPARE(ReadAll(ourOut), ReadAll(cliOut));
    QCOMPARE(ReadAll(utf8Out).toStdString(), Cp1252ToUtf8(ReadAll(cliOut).toStdString()));
  }

  void importAppendsAfterTheAddRecordsCheck() {
    TempDir dir;
    const std::string src = CopySample("Contacts", dir.path());
    RunCli({"export-csv", QString::fromStdString(src), QString::fromStdString(dir.File("in.csv"))});
    Open c(src);
    const size_t before = c.db.recordCount();
    gui::DataTarget target = c.Target();
    ModalAnswers answers({[&](QWidget* w) {
                            w->findChild<QLineEdit*>("csvImportPath")->setText(QString::fromStdString(dir.File("in.csv")));
                            w->findChild<QComboBox*>("csvEncoding")->setCurrentIndex(1);
                            qobject_cast<QDialog*>(w)->accept();
                          },
                          [](QWidget* summary) { Reject(summary); }});
    QVERIFY(gui::ImportCsvCommand(nullptr, target));
    QCOMPARE(c.db.recordCount(), before * 2);
    QCOMPARE(c.session.view.size(), before * 2);
    QVERIFY(c.viewChanges > 0);
  }

  void importSummaryNamesTheLinesStoredOtherwise() {
    TempDir dir;
    const std::string src = CopySample("Contacts", dir.path());
    QFile csv(QString::fromStdString(dir.File("in.csv")));
    QVERIFY(csv.open(QIODevice::WriteOnly));
    csv.write("Ann,1,,,1\nZed,2,,,yes\n");
    csv.close();
    Open c(src);
    gui::DataTarget target = c.Target();
    QString summary;
    ModalAnswers answers({[&](QWidget* w) {
                            w->findChild<QLineEdit*>("csvImportPath")->setText(QString::fromStdString(dir.File("in.csv")));
                            qobject_cast<QDialog*>(w)->accept();
                          },
                          [&](QWidget* box) {
                            summary = qobject_cast<QMessageBox*>(box)->text();
                            Reject(box);
                          }});
    QVERIFY(gui::ImportCsvCommand(nullptr, target));
    QVERIFY2(summary.contains("2 of 2 lines imported"), qPrintable(summary));
    QVERIFY2(summary.contains("1 line holds"), qPrintable(summary));
    QVERIFY2(summary.contains("line 2, field \"Favorite\" (Check-Box): \"yes\""), qPrintable(summary));
  }

  // A slip in the file dialog must not turn a database into text.
  void textExportsAskBeforeWritingOverADatabase() {
    TempDir dir;
    const std::string src = CopySample("Contacts", dir.path());
    const std::string other = CopySample("Orders", dir.path());
    const QByteArray otherBytes = ReadAll(other), srcBytes = ReadAll(src);
    Open c(src);
    gui::DataTarget target = c.Target();
    for (const std::string& victim : {other, src}) {
      QString asked;
      ModalAnswers answers({[&](QWidget* w) {
                              w->findChild<QLineEdit*>("csvExportPath")->setText(QString::fromStdString(victim));
                              qobject_cast<QDialog*>(w)->accept();
                            },
                            [&](QWidget* box) {
                              asked = box->objectName();
                              qobject_cast<QMessageBox*>(box)->button(QMessageBox::No)->click();
                            }});
      QVERIFY(!gui::ExportCsvCommand(nullptr, target));
      QCOMPARE(asked, QString("textTargetQuestion"));
    }
    QCOMPARE(ReadAll(other), otherBytes);
    QCOMPARE(ReadAll(src), srcBytes);

    // The report's "Export" asks the same, and Yes writes.
    gui::ReportResultsDialog results("Report\r\n");
    results.setSourcePath(src);
    ModalAnswers no({[](QWidget* box) { qobject_cast<QMessageBox*>(box)->button(QMessageBox::No)->click(); }});
    QVERIFY(!results.ExportTo(src));
    QCOMPARE(ReadAll(src), srcBytes);
    ModalAnswers yes({[](QWidget* box) { qobject_cast<QMessageBox*>(box)->button(QMessageBox::Yes)->click(); }});
    QVERIFY(results.ExportTo(other));
    QVERIFY(ReadAll(other).startsWith("Report\r\n"));
  }

  void reportShowsAndExportsTheToolsText() {
    TempDir dir;
    const std::string src = CopySample("Orders", dir.path());
    const std::string cliOut = dir.File("cli.txt"), ourOut = dir.File("ours.txt");
    RunCli({"report", QString::fromStdString(src), "Quantity", "-o", QString::fromStdString(cliOut)});
    Open o(src);
    gui::DataTarget target = o.Target();
    QString shown;
    ModalAnswers answers({[&](QWidget* w) {
                            auto* results = qobject_cast<gui::ReportResultsDialog*>(w);
                            QVERIFY(results);
                            shown = results->shownText();
                            QVERIFY(results->ExportTo(ourOut));
                            results->done(gui::ReportResultsDialog::kNewReport);
                          },
                          [](QWidget* chooser) {
                            // "New Report" goes back to the field choice.
                            QVERIFY(qobject_cast<gui::ReportChooserDialog*>(chooser));
                            Reject(chooser);
                          }});
    gui::RunReportCommand(nullptr, target, 3);
    QVERIFY(answers.allAnswered());
    QCOMPARE(ReadAll(ourOut), ReadAll(cliOut));
    QVERIFY(shown.startsWith("Report for Quantity\n"));
    QVERIFY(!shown.contains('\r'));
  }

  void printingToPdfHoldsTheListingWithLinkedRecordsIndented() {
    TempDir dir;
    CopySample("Orders", dir.path());
    const std::string src = CopySample("Contacts", dir.path());
    Open c(src);
    LinkServices services = SecuredLinkServices(c.ui, &c.locale);
    LinkedRecordsListing linked(services, c.locale);
    const QString listing = gui::ListingText(c.session, false, 0, &linked);
    QVERIFY(listing.contains("Name: Ana M\u00fcller\n"));
    QVERIFY(listing.contains("\n   Item: Espresso beans 1 kg\n"));

    const QString pdf = QString::fromStdString(dir.File("out.pdf"));
    {
      QPrinter printer(QPrinter::HighResolution);
      printer.setOutputFormat(QPrinter::PdfFormat);
      printer.setOutputFileName(pdf);
      gui::ListingPages pages(printer, listing);
      QCOMPARE(pages.count(), 1);
      QVERIFY(pages.Print("Contacts"));
    }
    QProcess p;
    p.start("pdftotext", {"-layout", pdf, "-"});
    QVERIFY(p.waitForFinished(30000));
    const QString text = QString::fromUtf8(p.readAllStandardOutput());
    QVERIFY2(text.contains("Name: Ana M\u00fcller"), qPrintable(text));
    QVERIFY(text.contains("   Item: Espresso beans 1 kg"));
    QVERIFY(text.contains("----------------------------------------"));
    QVERIFY(!text.contains("Photo:"));  // not marked Export/Print

    // Long listings go on over pages, and a line wider than the paper
    // continues below instead of being cut off.
    QString longListing;
    for (int i = 0; i < 150; ++i) longListing += QString("Line: %1\n").arg(i);
    longListing += "Note: " + QString(300, 'x') + "END\n";
    const QString pdf2 = QString::fromStdString(dir.File("long.pdf"));
    QPrinter printer(QPrinter::HighResolution);
    printer.setOutputFormat(QPrinter::PdfFormat);
    printer.setOutputFileName(pdf2);
    gui::ListingPages pages(printer, longListing);
    QVERIFY(pages.count() >= 2);
    int seen = 0;
    QVERIFY(pages.Print("Long", [&](int page, int) { return ++seen, page >= 0; }));
    QCOMPARE(seen, pages.count());
    QProcess p2;
    p2.start("pdftotext", {pdf2, "-"});
    QVERIFY(p2.waitForFinished(30000));
    const QString text2 = QString::fromUtf8(p2.readAllStandardOutput());
    QVERIFY(text2.contains("Line: 149"));
    QVERIFY(text2.contains("xEND"));
  }

  void aPrintCommandSettingTakesTheListingInsteadOfTheDialog() {
    TempDir dir;
    Open o(CopySample("Orders", dir.path()));
    auto settings = OpenDesktopSettings();
    settings->Set(gui::kPrintCommandSetting, "true --ignored");
    gui::DataTarget target = o.Target();
    const bool printed = gui::PrintCommand(nullptr, target, true);
    settings->Remove(gui::kPrintCommandSetting);
    QVERIFY(printed);
    QCOMPARE(o.ui.messages.back().text, std::string("Data Printed OK"));
  }

  void everyDialogHasItsHelpSectionAndPicture() {
    for (const char* anchor : {"Sort_Dialog", "Filter_Dialog", "Find_Dialog", "Report_Dialog", "Csv_Export",
                               "Transfer_Records", "Print_Records", "Beam_Dialog", "Receive_Window"}) {
      QVERIFY2(gui::HelpHasAnchor(anchor), anchor);
    }
    QFile help(":/help/cardovex.html");
    QVERIFY(help.open(QIODevice::ReadOnly));
    const QString html = QString::fromUtf8(help.readAll());
    static const QRegularExpression picture("<img src=\"(data-[a-z-]+\\.png)\"");
    int pictures = 0;
    for (auto it = picture.globalMatch(html); it.hasNext(); ++pictures) {
      const QString name = it.next().captured(1);
      QVERIFY2(QImage(":/help/" + name).width() > 0, qPrintable(name));
    }
    QVERIFY(pictures >= 8);
  }

  void transferCopiesIntoTheChosenDatabaseAndRefusesAMoveToItself() {
    TempDir dir;
    const std::string src = CopySample("Orders", dir.path()), dst = CopySample("Orders", dir.path(), "Copy");
    Open o(src);
    const size_t count = o.db.recordCount();
    gui::DataTarget target = o.Target();
    QVERIFY(gui::TransferToFile(target, /*move=*/false, /*all=*/true, dst));
    // Moving to the database itself is refused, and nothing is lost.
    QVERIFY(!gui::TransferToFile(target, /*move=*/true, /*all=*/true, src));
    QCOMPARE(o.ui.messages.back().text, std::string("ERROR: Cannot perform this operation to the same database"));
    Open copy(dst);
    QCOMPARE(copy.db.recordCount(), count * 2);
    QCOMPARE(o.db.recordCount(), count);
  }
};

}  // namespace cx::testing

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  QApplication app(argc, argv);
  cx::testing::DataDialogsTest test;
  return QTest::qExec(&test, argc, argv);
}

#include "dialogs_test.moc"
