// SPDX-License-Identifier: MIT
#pragma once

/// \file
/// What the installed peers have for files.

#ifdef ORB_BENCH_GLIB  // Before Qt, whose macros its names meet.
#include <gio/gio.h>
#endif
#ifdef ORB_BENCH_QT
#include <QDateTime>
#include <QDir>
#include <QFile>
#include <QFileInfo>
#include <QStorageInfo>
#include <QString>
#endif
#ifdef ORB_BENCH_BOOST
#include <boost/filesystem.hpp>
#endif
