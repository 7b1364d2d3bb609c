@echo off
rem Runs every test of this folder and writes test-log.txt. The exit status is 0 if none fails.
rem If an administrator runs it, it also registers the extension, checks what Windows shows, and unregisters it.
"%~dp0tests\run_tests.exe"
exit /b %errorlevel%
