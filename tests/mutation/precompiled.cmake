# Given to CMake by the mutation check alone: what each mutant would compile again.
cmake_language(DEFER CALL target_precompile_headers velk_agent PRIVATE <QtCore/QtCore> <QtDBus/QtDBus> <QtNetwork/QtNetwork>)
