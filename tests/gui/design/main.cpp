// One program for the design dialogs' widget tests.
#include <QApplication>

int RunFieldEditorDialogTest(int argc, char** argv);
int RunDatabaseDialogsTest(int argc, char** argv);
int RunCliEquivalenceTest(int argc, char** argv);
int RunNewDatabaseDesignTest(int argc, char** argv);
int RunAccessWalkTest(int argc, char** argv);
#ifdef CARDOVEX_WALK_MAIN
int RunMainWindowDesignTest(int argc, char** argv);
#endif

int main(int argc, char** argv) {
  if (qEnvironmentVariableIsEmpty("QT_QPA_PLATFORM")) qputenv("QT_QPA_PLATFORM", "offscreen");
  // A dialog nobody answers fails its test in two minutes, and without a
  // debugger attached to the stuck program.
  if (qEnvironmentVariableIsEmpty("QTEST_FUNCTION_TIMEOUT")) qputenv("QTEST_FUNCTION_TIMEOUT", "120000");
  qputenv("QTEST_DISABLE_STACK_DUMP", "1");
  QApplication app(argc, argv);
  int failed = 0;
  failed += RunFieldEditorDialogTest(argc, argv);
  failed += RunDatabaseDialogsTest(argc, argv);
  failed += RunCliEquivalenceTest(argc, argv);
  failed += RunNewDatabaseDesignTest(argc, argv);
  failed += RunAccessWalkTest(argc, argv);
#ifdef CARDOVEX_WALK_MAIN
  failed += RunMainWindowDesignTest(argc, argv);
#endif
  return failed == 0 ? 0 : 1;
}
