package tarnwick;

/** The external platform of an `ExternalAuth` login (`EOS_EExternalCredentialType`). **/
enum abstract ExternalType(Int) from Int to Int {
	var Epic = 0;
	var SteamAppTicket = 1;
	var PsnIdToken = 2;
	var XblXstsToken = 3;
	var DiscordAccessToken = 4;
	var GogSessionTicket = 5;
	var NintendoIdToken = 6;
	var NintendoNsaIdToken = 7;
	var UplayAccessToken = 8;
	var OpenIdAccessToken = 9;
	var DeviceIdAccessToken = 10;
	var AppleIdToken = 11;
	var GoogleIdToken = 12;
	var OculusUserIdNonce = 13;
	var ItchioJwt = 14;
	var ItchioKey = 15;
	var EpicIdToken = 16;
	var AmazonAccessToken = 17;
	var SteamSessionTicket = 18;
}
