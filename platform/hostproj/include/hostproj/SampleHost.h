//===-- hostproj/SampleHost.h - a host that serves a project from a text file --===//
//
// \file
// The sample host is two component libraries (hostproj/Components.h names them): the
// task helper, which opens the project described by the file named in the environment
// variable VENLOMER_PROJECT, and the project manager, which serves that project's view
// network. It lets the project lookup run end to end without the host.
//
// The description is read again each time a task helper is created, that is once per
// lookup, and replaces the project opened before. Without VENLOMER_PROJECT no project
// is open. A file that cannot be read or does not parse is reported as an error message
// naming the file and line, and no project is open.
//
// The description file
// --------------------
// One directive per line; blank lines and lines starting with '#' are ignored. Words are
// separated by blanks; a word in double quotes may hold blanks or be empty (""), and
// inside quotes \" and \\ stand for " and \.
//
//   project TEXT            the open project and its file name (may be ""); without
//                           this line no project is open
//   view NAME [TYPE [second]]
//                           a view; its type's identifier is TYPE, read through
//                           Dpm::IDefDataId, or with `second` only through
//                           Dpm::IDataIdentity; without TYPE the view has no type
//   default NAME            the view served as the default view network (kind 4)
//   unit VIEW TYPE DIR FILE [no-id] [no-file-access] [no-file]
//                           a design unit of VIEW, in file DIR followed by FILE; TYPE
//                           "-" gives a unit without type; no-id: its type answers no
//                           Dpm::IDefDataId; no-file-access: the unit answers no
//                           Dpm::IDesignUnitFile; no-file: that gives no Dpm::IHdlFile
//   binding VIEW [VIEW...]  a transform binding instance of the first view producing
//                           the views listed, in that order
//   counting prjrep|common  which counting interface host objects answer (default
//                           prjrep); `common`: only CommonI::IRefCount
//   fail STEP               makes one step of a lookup fail; STEP is one of
//       task-helper              the task-helper object answers no ITaskHelper
//       context-status           the context query answers 0 (with a context object)
//       context                  the context query gives no context
//       project-manager          the context gives no project manager
//       current-project          the project manager gives no project
//       iproject                 the project object answers no IProject
//       project-helper           the project helper class creates nothing
//       project-helper-interface the created object answers no Dpm::IProjectHelper
//       project-reference        ... no Dpm::IProjectCompReference
//       view-network-help        ... no Dpm::IViewNetworkHelp
//       default-view-network     the view network of kind 4 is null
//       default-view             the default view network answers no Dpm::IView
//       design-units             every view's design-unit iterator is null
//       binding-set              every view's binding-instance set is null
//       binding-iterator         every binding-instance set's iterator is null
//       binding-views            every binding instance's views are null
//       views-iterator           ... answer no Prjrep::IIterator
//
// Views, units and bindings may name views declared further down. Example:
//
//   project "/work/top/top.zam"
//   view synth VIEW_Synthesis
//   view xlate VIEW_Translation
//   default synth
//   unit synth DESUT_UCF "/work/top/" "top.ucf"
//   binding synth xlate
//   unit xlate DESUT_NGD "/work/top/" "top.ngd"
//
// Diagnostics for tests, exported by the libraries as plain C functions (reach them
// with dlsym on the path CitP::Factory::LoadedPath gives):
//
//   int  VenlomerSampleTaskHelper_AliveObjects();   // objects of the task helper alive
//   int  VenlomerSampleTaskHelper_SessionObjects(); // of those, held by the open session
//   void VenlomerSampleTaskHelper_CloseProject();   // drops the session's own references
//   int  VenlomerSampleProjMgr_AliveObjects();      // objects of the project manager alive
//
//===------------------------------------------------------------------------------===//
#pragma once
