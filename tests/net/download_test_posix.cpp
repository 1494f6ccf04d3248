bool PlatformCopyReportsProgress() { return true; }
