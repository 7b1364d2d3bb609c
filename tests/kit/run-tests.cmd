@echo off
rem Runs every test of this folder and writes test-log.txt. The exit status is 0 if none failed.
rem As administrator it also registers the extension, asks Windows for what it shows, and unregisters it.
"%~dp0tests\run_tests.exe"
exit /b %errorlevel%
