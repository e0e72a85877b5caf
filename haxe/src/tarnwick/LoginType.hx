package tarnwick;

/** How the Epic account signs in (`EOS_ELoginCredentialType`). **/
enum abstract LoginType(Int) from Int to Int {
	/** `loginId` = e-mail, `loginToken` = password (development only). **/
	var Password = 0;
	/** `loginToken` = an exchange code, e.g. from the launcher's command line. **/
	var ExchangeCode = 1;
	/** A login kept by an earlier session; no id or token. **/
	var PersistentAuth = 2;
	var DeviceCode = 3;
	/** `loginId` = host:port of the Developer Authentication Tool, `loginToken` = credential name. **/
	var Developer = 4;
	/** `loginToken` = a refresh token. **/
	var RefreshToken = 5;
	/** Opens the account portal in the overlay. **/
	var AccountPortal = 6;
	/** `loginToken` = an external platform's token, `externalType` tells which. **/
	var ExternalAuth = 7;
}
