@echo off
rem Script shell of pinforge's Tcl path on Windows: runs the generated driver script with
rem tclsh from PATH and ends with tclsh's exit code.
if "%~1"=="" (
  echo usage: runscr ^<script.tcl^> 1>&2
  exit /b 2
)
tclsh "%~1"
exit /b %ERRORLEVEL%
